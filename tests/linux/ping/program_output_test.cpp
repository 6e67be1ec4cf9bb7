#include "platform/linux/ping/program_output.h"

#include <gtest/gtest.h>

#include "platform/linux/ping/program_run.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

TEST(ProgramOutputTest, SummaryIsFoundAmongTheLines) {
  const auto summary = parseProgramOutput(R"(PING 10.0.0.2 (10.0.0.2) 56(84) bytes of data.
64 bytes from 10.0.0.2: icmp_seq=1 ttl=64 time=0.045 ms

--- 10.0.0.2 ping statistics ---
3 packets transmitted, 1 received, 66.6667% packet loss, time 2003ms
rtt min/avg/max/mdev = 0.045/0.045/0.045/0.000 ms)");
  ASSERT_TRUE(summary);
  EXPECT_EQ(summary->transmitted, 3U);
  EXPECT_EQ(summary->received, 1U);
  EXPECT_EQ(summary->line, "3 packets transmitted, 1 received, 66.6667% packet loss, time 2003ms");
}

TEST(ProgramOutputTest, OtherProgramsSayPacketsTwice) {
  const auto summary = parseProgramOutput("2 packets transmitted, 2 packets received, 0% packet loss\n");
  ASSERT_TRUE(summary);
  EXPECT_EQ(summary->received, 2U);
}

TEST(ProgramOutputTest, WithoutASummaryTheLastLineIsWhatItSaid) {
  const std::string output = "a warning\nping: connect: Network is unreachable\n\n";
  EXPECT_FALSE(parseProgramOutput(output));
  EXPECT_FALSE(parseProgramOutput("3 packets transmitted, many received"));
  EXPECT_FALSE(parseProgramOutput(""));
  EXPECT_EQ(lastLine(output), "ping: connect: Network is unreachable");
  EXPECT_EQ(lastLine("\n\n"), "");
}

TEST(ProgramOutputTest, CommandIsNumericAndRoundsTheTimeUp) {
  EXPECT_EQ(pingCommand("ping", "10.0.0.2", "en0", 7500ms),
            (std::vector<std::string>{"ping", "-n", "-I", "en0", "-w", "8", "10.0.0.2"}));
  EXPECT_EQ(pingCommand("ping", "10.0.0.2", "en0", 0s)[5], "1");
}

}  // namespace
}  // namespace zal
