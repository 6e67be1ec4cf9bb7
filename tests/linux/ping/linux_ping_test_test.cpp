#include "platform/linux/ping/linux_ping_test.h"

#include "tests/linux/ping/ping_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

class LinuxPingTestTest : public testing::PingFixture {};

TEST_F(LinuxPingTestTest, NothingPermittedIsTheReason) {
  ASSERT_TRUE(network->near("echo 1 0 > /proc/sys/net/ipv4/ping_group_range"));
  methods.rawSocket = false;
  methods.program.clear();
  run("10.77.0.2", 5);
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "no way of pinging is permitted: datagram socket: Permission denied; no program");
}

TEST_F(LinuxPingTestTest, UnknownHost) {
  const std::string output = run("no-such-host.invalid", 20);
  EXPECT_FALSE(success);
  EXPECT_TRUE(result.starts_with("unknown host no-such-host.invalid (")) << result;
  EXPECT_EQ(output, "ping: " + result + "\n");
}

TEST_F(LinuxPingTestTest, HostNamesAreResolved) {
  ASSERT_TRUE(network->near("ip addr add 127.0.0.1/8 dev lo || true"));
  run("localhost", 0.9);
  EXPECT_NE(text().find("PING localhost ("), std::string::npos) << text();
}

TEST_F(LinuxPingTestTest, MissingInterfaceIsTheReason) {
  ASSERT_TRUE(network->near("ip link del en0"));
  run("10.77.0.2", 3600);
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "there is no interface en0");
}

TEST_F(LinuxPingTestTest, InterfaceThatIsDownEndsAtOnce) {
  ASSERT_TRUE(network->near("ip link set en0 down"));
  run("10.77.0.2", 3600);
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "no way to 10.77.0.2 over en0: Network is unreachable");
}

TEST_F(LinuxPingTestTest, InterfaceThatVanishesIsSeenInTheText) {
  prepare("10.77.0.2");
  start(3600);
  ASSERT_TRUE(waitForText("icmp_seq=1 "));
  ASSERT_TRUE(network->near("ip link del en0"));
  ASSERT_TRUE(waitForText("ping: icmp_seq=2 send: "));
  ping->stop();
  finish();
  EXPECT_TRUE(success);
}

TEST_F(LinuxPingTestTest, StoppedEarlyCompletesOnceWithWhatItHas) {
  prepare("10.77.0.2");
  start(3600);
  EXPECT_EQ(ping->secondsToRun(), 3600.0);
  ASSERT_TRUE(waitForText("icmp_seq=1 "));
  ping->stop();
  ping->stop();
  finish();
  EXPECT_TRUE(success);
  EXPECT_EQ(completions, 1);
  EXPECT_FALSE(queue.runNext(0ms));
}

TEST_F(LinuxPingTestTest, CompletionComesOnTheGivenQueueOnlyOnce) {
  run("10.77.0.2", 0.1);
  ping->stop();
  EXPECT_EQ(completions, 1);
  loop.reset();
  EXPECT_TRUE(queue.isEmpty());
}

TEST_F(LinuxPingTestTest, StopBeforeTheStartIsNothing) {
  prepare("10.77.0.2");
  EXPECT_EQ(ping->secondsToRun(), 0.0);
  ping->stop();
  start(0.5);
  finish();
  EXPECT_TRUE(success);
}

TEST_F(LinuxPingTestTest, RunningTestKeepsItselfAlive) {
  prepare("10.77.0.2");
  start(0.5);
  ping.reset();
  ASSERT_TRUE(queue.runNext(testing::kDeadline));
  EXPECT_TRUE(success);
}

TEST_F(LinuxPingTestTest, LoopThatGoesTakesTheWorkOfATestWithItWhoeverStillHoldsTheTest) {
  prepare("10.77.0.2");
  const auto held = std::make_shared<int>();
  ping->startWithTimeout(3600, queue, [held](std::string_view, bool) { FAIL() << "completed"; });
  ASSERT_TRUE(waitForText("icmp_seq=1 "));
  loop.reset();
  EXPECT_EQ(held.use_count(), 1);
  EXPECT_TRUE(queue.isEmpty());
  EXPECT_NE(text().find("1 received"), std::string::npos);
}

TEST_F(LinuxPingTestTest, ResultFileFailuresNameTheErrorOnly) {
  prepare("10.77.0.2");
  std::string error;
  EXPECT_FALSE(ping->writeResultsToFile(directory / "missing/file", error));
  EXPECT_EQ(error, "No such file or directory");
  std::filesystem::create_directory(directory / "taken");
  EXPECT_FALSE(ping->writeResultsToFile(directory / "taken", error));
  start(0.2);
  finish();
  EXPECT_FALSE(ping->writeResultsToFile("/dev/full", error));
  EXPECT_EQ(error, "No space left on device");
}

TEST_F(LinuxPingTestTest, ALinkLaidAtTheResultsNameIsReplacedNotFollowed) {
  prepare("10.77.0.2");
  testing::writeFile(directory / "victim", "untouched");
  std::filesystem::create_symlink(directory / "victim", directory / "vistel-ping.log");
  std::string error;
  EXPECT_TRUE(ping->writeResultsToFile(directory / "vistel-ping.log", error)) << error;
  EXPECT_FALSE(std::filesystem::is_symlink(directory / "vistel-ping.log"));
  EXPECT_EQ(testing::readFile(directory / "victim"), "untouched");
}

TEST_F(LinuxPingTestTest, NoResultsAreWrittenThroughALinkBelowARoot) {
  std::filesystem::create_directories(directory / "elsewhere");
  std::filesystem::create_directories(directory / "root");
  std::filesystem::create_directory_symlink("../elsewhere", directory / "root/Statistics");
  LinuxPingFacility rooted(loop->context, Interfaces{}, log, {}, {{directory / "root"}, ""});
  std::string error;
  EXPECT_FALSE(
      rooted.makeTest("10.77.0.2", true)->writeResultsToFile(directory / "root/Statistics/ping.log", error));
  EXPECT_EQ(error, "Too many levels of symbolic links");
  EXPECT_TRUE(std::filesystem::is_empty(directory / "elsewhere"));
}

TEST_F(LinuxPingTestTest, LongIntervalIsAMinute) {
  prepare("10.77.0.2");
  EXPECT_EQ(ping->longTimeInterval(), 60.0);
}

}  // namespace
}  // namespace zal
