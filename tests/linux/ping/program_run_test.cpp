#include "platform/linux/ping/program_run.h"

#include <signal.h>

#include "tests/linux/ping/ping_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

class ProgramRunTest : public testing::PingFixture {
 protected:
  /// Starts a test over a program of ours and waits until that is at work.
  void startProgram(const std::string& first, const std::string& afterwards) {
    methods.datagramSocket = methods.rawSocket = false;
    methods.program = directory / "program";
    testing::writeFile(methods.program, "#!/bin/sh\n" + first + "\nprintf \"%s\\n\" \"$*\" > " +
                                            directory.path() + "/making && mv " + directory.path() +
                                            "/making " + directory.path() + "/ready\n" + afterwards + "\n");
    std::filesystem::permissions(methods.program, std::filesystem::perms::owner_all);
    prepare("10.77.0.2");
    start(3600);
    ASSERT_TRUE(waitUntil([&] { return std::filesystem::exists(directory / "ready"); }));
  }
};

TEST_F(ProgramRunTest, AnswerThroughTheProgramWhereNoSocketIsPermitted) {
  methods.datagramSocket = methods.rawSocket = false;
  const std::string output = run("10.77.0.2", 1.0);
  EXPECT_TRUE(success) << output;
  EXPECT_TRUE(std::regex_match(
      result, std::regex("[12] packets transmitted, [12] received, 0% packet loss, time [0-9]+ms")))
      << result;
  EXPECT_NE(output.find("64 bytes from 10.77.0.2: icmp_seq=1 ttl=64 time="), std::string::npos) << output;
  EXPECT_NE(output.find("\n" + result + "\n"), std::string::npos) << output;
}

TEST_F(ProgramRunTest, ProgramIsInterruptedEarlyAndStillSumsUp) {
  startProgram("trap 'echo 1 packets transmitted, 1 received, 0% packet loss; exit 0' INT",
               "while :; do sleep 0.05; done");
  EXPECT_EQ(testing::readFile(directory / "ready"), "-n -I en0 -w 3600 10.77.0.2\n");
  ping->stop();
  finish();
  EXPECT_TRUE(success);
  EXPECT_EQ(result, "1 packets transmitted, 1 received, 0% packet loss");
  EXPECT_EQ(text(), result + "\n");
}

TEST_F(ProgramRunTest, ProgramThatDoesNotEndIsKilled) {
  startProgram("trap '' INT; echo I stay", "exec sleep 3600");
  const auto begin = std::chrono::steady_clock::now();
  ping->stop();
  finish();
  EXPECT_GE(std::chrono::steady_clock::now() - begin, 2s);
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "I stay");
  EXPECT_EQ(completions, 1);
}

TEST_F(ProgramRunTest, LoopThatGoesTakesTheProgramWithIt) {
  startProgram("trap '' INT; echo $$ > " + (directory / "pid"), "exec sleep 3600");
  const pid_t child = std::stoi(testing::readFile(directory / "pid"));
  ping.reset();
  loop.reset();
  EXPECT_EQ(::kill(child, 0), -1);
  EXPECT_EQ(completions, 0);
}

TEST_F(ProgramRunTest, MissingProgramIsTheReason) {
  methods.datagramSocket = methods.rawSocket = false;
  methods.program = "/nonexistent/ping";
  run("10.77.0.2", 5);
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "/nonexistent/ping: No such file or directory");
}

}  // namespace
}  // namespace zal
