#include "platform/linux/ping/ping_text.h"

#include <gtest/gtest.h>

#include <clocale>

#include "platform/linux/ping/ping_report.h"
#include "platform/linux/ping/ping_statistics.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

TEST(PingTextTest, HeadingNamesHostAddressSourceAndInterface) {
  EXPECT_EQ(pingHeading(IpFamily::v4, "relay", "10.0.0.2", "10.0.0.1", "en0"),
            "PING relay (10.0.0.2) from 10.0.0.1 en0: 56(84) bytes of data.");
  EXPECT_EQ(pingHeading(IpFamily::v6, "relay", "fd00::2", "", "en0"),
            "PING relay (fd00::2) from en0: 56 data bytes");
}

TEST(PingTextTest, AnswerLineShowsThreeDigitsOfTheRoundTrip) {
  const auto line = [](std::chrono::microseconds roundTrip) {
    return answerText({64, "10.0.0.2", 1, 64, roundTrip, false});
  };
  EXPECT_EQ(line(45us), "64 bytes from 10.0.0.2: icmp_seq=1 ttl=64 time=0.045 ms");
  EXPECT_EQ(line(4567us), "64 bytes from 10.0.0.2: icmp_seq=1 ttl=64 time=4.57 ms");
  EXPECT_EQ(line(45670us), "64 bytes from 10.0.0.2: icmp_seq=1 ttl=64 time=45.7 ms");
  EXPECT_EQ(line(456700us), "64 bytes from 10.0.0.2: icmp_seq=1 ttl=64 time=457 ms");
}

TEST(PingTextTest, AnswerLineWithoutHopLimitAndOfADuplicate) {
  EXPECT_EQ(answerText({64, "fd00::2", 7, std::nullopt, 1ms, true}),
            "64 bytes from fd00::2: icmp_seq=7 time=1.00 ms (DUP!)");
}

TEST(PingTextTest, ErrorsAreNamedAsPeopleKnowThem) {
  EXPECT_EQ(icmpErrorText(IpFamily::v4, 3, 1), "Destination Host Unreachable");
  EXPECT_EQ(icmpErrorText(IpFamily::v4, 11, 0), "Time to Live Exceeded");
  EXPECT_EQ(icmpErrorText(IpFamily::v6, 1, 0), "Destination Unreachable: No Route");
  EXPECT_EQ(icmpErrorText(IpFamily::v6, 200, 9), "ICMP error, type 200 code 9");
}

TEST(PingStatisticsTest, SummaryOfAPartlyLostRun) {
  PingStatistics statistics;
  statistics.transmitted = 3;
  statistics.addAnswer(45us);
  statistics.addAnswer(77us);
  statistics.elapsed = 2004ms;
  EXPECT_EQ(statistics.summary(), "3 packets transmitted, 2 received, 33.3333% packet loss, time 2004ms");
  EXPECT_EQ(statistics.roundTripLine(), "rtt min/avg/max/mdev = 0.045/0.061/0.077/0.016 ms");
}

TEST(PingStatisticsTest, DuplicatesAndErrorsAreCountedApart) {
  PingStatistics statistics;
  statistics.transmitted = 2;
  statistics.addAnswer(1500us);
  statistics.duplicates = 4;
  statistics.errors = 1;
  statistics.elapsed = 1s;
  EXPECT_EQ(statistics.summary(),
            "2 packets transmitted, 1 received, +4 duplicates, +1 errors, 50% packet loss, time 1000ms");
  EXPECT_EQ(statistics.roundTripLine(), "rtt min/avg/max/mdev = 1.500/1.500/1.500/0.000 ms");
}

TEST(PingStatisticsTest, NothingLostAndNothingAnswered) {
  PingStatistics statistics;
  EXPECT_EQ(statistics.summary(), "0 packets transmitted, 0 received, time 0ms");
  EXPECT_EQ(statistics.roundTripLine(), "");
  statistics.transmitted = 1;
  EXPECT_EQ(statistics.summary(), "1 packets transmitted, 0 received, 100% packet loss, time 0ms");
  statistics.addAnswer(1us);
  EXPECT_EQ(statistics.summary(), "1 packets transmitted, 1 received, 0% packet loss, time 0ms");
}

TEST(PingStatisticsTest, DecimalPointDoesNotDependOnTheLocale) {
  const char* const used = std::setlocale(LC_NUMERIC, "de_DE.UTF-8");
  if (used == nullptr) GTEST_SKIP() << "no locale with a decimal comma is installed";
  PingStatistics statistics;
  statistics.addAnswer(45us);
  const std::string line = statistics.roundTripLine();
  std::setlocale(LC_NUMERIC, "C");
  EXPECT_EQ(line, "rtt min/avg/max/mdev = 0.045/0.045/0.045/0.000 ms");
}

TEST(PingReportTest, TextEndsWithTheStatisticsOnceSomethingWasSent) {
  PingReport report("relay");
  report.addLine("first line");
  EXPECT_EQ(report.text(), "first line\n");
  report.updateStatistics([](PingStatistics& statistics) { statistics.transmitted = 1; });
  EXPECT_EQ(report.text(), R"(first line

--- relay ping statistics ---
1 packets transmitted, 0 received, 100% packet loss, time 0ms
)");
  EXPECT_FALSE(report.anyAnswer());
  report.updateStatistics([](PingStatistics& statistics) { statistics.addAnswer(45us); });
  EXPECT_EQ(report.text(), R"(first line

--- relay ping statistics ---
1 packets transmitted, 1 received, 0% packet loss, time 0ms
rtt min/avg/max/mdev = 0.045/0.045/0.045/0.000 ms
)");
  EXPECT_TRUE(report.anyAnswer());
}

TEST(PingReportTest, ReasonStandsForTheSummary) {
  PingReport report("relay");
  report.fail("unknown host relay");
  EXPECT_EQ(report.text(), "ping: unknown host relay\n");
  EXPECT_EQ(report.resultLine(), "unknown host relay");
  EXPECT_FALSE(report.anyAnswer());
}

TEST(PingReportTest, EndlessTextIsCutAndSaysSo) {
  PingReport report("relay");
  const std::string line(1023, 'x');
  for (int i = 0; i < 2000; ++i) report.addLine(line);
  const std::string text = report.text();
  EXPECT_EQ(text.size(), 1024U * 1024U + std::string("(further lines left out)\n").size());
  EXPECT_TRUE(text.ends_with("x\n(further lines left out)\n"));
}

}  // namespace
}  // namespace zal
