#include "platform/linux/ping/linux_ping_test.h"

#include <gtest/gtest.h>
#include <netinet/in.h>
#include <signal.h>
#include <sys/socket.h>

#include <condition_variable>
#include <deque>
#include <mutex>
#include <regex>

#include "platform/linux/ipc/descriptor.h"
#include "platform/linux/ping/icmp_packet.h"
#include "tests/linux/ping/network_namespaces.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

constexpr auto kDeadline = 30s;  // for what takes a second at most; a slow machine is no failure

/// A queue whose jobs the test takes out and runs.
class MailboxQueue : public WorkQueue {
 public:
  [[nodiscard]] const std::string& label() const override { return _label; }
  void async(Job job) override {
    const std::scoped_lock lock(_mutex);
    _jobs.push_back(std::move(job));
    _arrived.notify_all();
  }
  void asyncAfter(std::chrono::nanoseconds /*delay*/, Job job) override { async(std::move(job)); }

  bool runNext(std::chrono::nanoseconds deadline) {
    Job job;
    {
      std::unique_lock lock(_mutex);
      if (!_arrived.wait_for(lock, deadline, [&] { return !_jobs.empty(); })) return false;
      job = std::move(_jobs.front());
      _jobs.pop_front();
    }
    job();
    return true;
  }
  [[nodiscard]] bool isEmpty() {
    const std::scoped_lock lock(_mutex);
    return _jobs.empty();
  }

 private:
  const std::string _label = "mailbox";
  std::mutex _mutex;
  std::condition_variable _arrived;
  std::deque<Job> _jobs;
};

class LinuxPingTestTest : public ::testing::Test {
 protected:
  void SetUp() override {
    network = testing::NetworkNamespaces::make();
    if (!network) GTEST_SKIP() << "network namespaces are not permitted here";
    loop = std::make_unique<testing::NamespaceLoop>(network->nearName());
  }
  void TearDown() override { loop.reset(); }

  void prepare(const std::string& address, bool useWifi = true) {
    log.enabledCategories.insert("Ping");
    facility = std::make_unique<LinuxPingFacility>(loop->context, Interfaces{"en0", "pdp_ip0"}, log, methods);
    ping = facility->makeTest(address, useWifi);
  }
  void start(double seconds) {
    ping->startWithTimeout(seconds, queue, [this](std::string_view line, bool ok) {
      ++completions;
      result = line;
      success = ok;
    });
  }
  /// Runs a whole test and gives its result text.
  std::string run(const std::string& address, double seconds, bool useWifi = true) {
    prepare(address, useWifi);
    start(seconds);
    finish();
    return text();
  }
  void finish() { ASSERT_TRUE(queue.runNext(kDeadline)) << "no completion; so far: " << text(); }
  std::string text() {
    std::string error;
    const std::string path = directory / "result.txt";
    EXPECT_TRUE(ping->writeResultsToFile(path, error)) << error;
    return testing::readFile(path);
  }
  /// The text with all times as T.
  static std::string timeless(const std::string& text) {
    const std::string times = std::regex_replace(text, std::regex("time=[0-9.]+ ms"), "time=T ms");
    const std::string total = std::regex_replace(times, std::regex("time [0-9]+ms"), "time Tms");
    return std::regex_replace(total, std::regex("= [0-9./]+ ms"), "= T ms");
  }
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
  template <typename Condition>
  static bool waitUntil(Condition condition) {
    const auto end = std::chrono::steady_clock::now() + kDeadline;
    while (std::chrono::steady_clock::now() < end) {
      if (condition()) return true;
      std::this_thread::sleep_for(1ms);
    }
    return false;
  }
  bool waitForText(const std::string& part) {
    return waitUntil([&] { return text().find(part) != std::string::npos; });
  }

  std::unique_ptr<testing::NetworkNamespaces> network;
  testing::TemporaryDirectory directory;
  testing::RecordingAgentLog log;
  MailboxQueue queue;
  PingMethods methods;
  std::unique_ptr<LinuxPingFacility> facility;
  std::unique_ptr<testing::NamespaceLoop> loop;
  std::shared_ptr<PingTest> ping;
  int completions = 0;
  std::string result;
  bool success = false;
};

constexpr const char* kOneAnswer = R"(PING 10.77.0.2 (10.77.0.2) from 10.77.0.1 en0: 56(84) bytes of data.
64 bytes from 10.77.0.2: icmp_seq=1 ttl=64 time=T ms

--- 10.77.0.2 ping statistics ---
1 packets transmitted, 1 received, 0% packet loss, time Tms
rtt min/avg/max/mdev = T ms
)";

TEST_F(LinuxPingTestTest, AnswerThroughADatagramSocket) {
  if (!network->near("echo 0 2147483647 > /proc/sys/net/ipv4/ping_group_range")) {
    GTEST_SKIP() << "this host has no unprivileged ping sockets";
  }
  methods.rawSocket = false;
  methods.program.clear();
  EXPECT_EQ(timeless(run("10.77.0.2", 0.9)), kOneAnswer);
  EXPECT_TRUE(success);
  EXPECT_EQ(timeless(result), "1 packets transmitted, 1 received, 0% packet loss, time Tms");
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"log:Ping: Pinging 10.77.0.2 over en0 through a datagram socket"});
}

TEST_F(LinuxPingTestTest, AnswerThroughARawSocketWhereDatagramSocketsAreRefused) {
  ASSERT_TRUE(network->near("echo 1 0 > /proc/sys/net/ipv4/ping_group_range"));
  methods.program.clear();
  EXPECT_EQ(timeless(run("10.77.0.2", 0.9)), kOneAnswer);
  EXPECT_TRUE(success);
  EXPECT_EQ(log.lines, std::vector<std::string>{"log:Ping: Pinging 10.77.0.2 over en0 through a raw socket"});
}

TEST_F(LinuxPingTestTest, AnswerThroughTheProgramWhereNoSocketIsPermitted) {
  methods.datagramSocket = methods.rawSocket = false;
  const std::string output = run("10.77.0.2", 1.0);
  EXPECT_TRUE(success) << output;
  EXPECT_TRUE(std::regex_match(
      result, std::regex("[12] packets transmitted, [12] received, 0% packet loss, time [0-9]+ms")))
      << result;
  EXPECT_NE(output.find("64 bytes from 10.77.0.2: icmp_seq=1 ttl=64 time="), std::string::npos) << output;
  EXPECT_NE(output.find("\n" + result + "\n"), std::string::npos) << output;
}

TEST_F(LinuxPingTestTest, ProgramIsInterruptedEarlyAndStillSumsUp) {
  startProgram("trap 'echo 1 packets transmitted, 1 received, 0% packet loss; exit 0' INT",
               "while :; do sleep 0.05; done");
  EXPECT_EQ(testing::readFile(directory / "ready"), "-n -I en0 -w 3600 10.77.0.2\n");
  ping->stop();
  finish();
  EXPECT_TRUE(success);
  EXPECT_EQ(result, "1 packets transmitted, 1 received, 0% packet loss");
  EXPECT_EQ(text(), result + "\n");
}

TEST_F(LinuxPingTestTest, ProgramThatDoesNotEndIsKilled) {
  startProgram("trap '' INT; echo I stay", "exec sleep 3600");
  const auto begin = std::chrono::steady_clock::now();
  ping->stop();
  finish();
  EXPECT_GE(std::chrono::steady_clock::now() - begin, 2s);
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "I stay");
  EXPECT_EQ(completions, 1);
}

TEST_F(LinuxPingTestTest, LoopThatGoesTakesTheProgramWithIt) {
  startProgram("trap '' INT; echo $$ > " + (directory / "pid"), "exec sleep 3600");
  const pid_t child = std::stoi(testing::readFile(directory / "pid"));
  ping.reset();
  loop.reset();
  EXPECT_EQ(::kill(child, 0), -1);
  EXPECT_EQ(completions, 0);
}

TEST_F(LinuxPingTestTest, MissingProgramIsTheReason) {
  methods.datagramSocket = methods.rawSocket = false;
  methods.program = "/nonexistent/ping";
  run("10.77.0.2", 5);
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "/nonexistent/ping: No such file or directory");
}

TEST_F(LinuxPingTestTest, NothingPermittedIsTheReason) {
  ASSERT_TRUE(network->near("echo 1 0 > /proc/sys/net/ipv4/ping_group_range"));
  methods.rawSocket = false;
  methods.program.clear();
  run("10.77.0.2", 5);
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "no way of pinging is permitted: datagram socket: Permission denied; no program");
}

TEST_F(LinuxPingTestTest, CellularTestsUseTheCellularInterface) {
  EXPECT_EQ(timeless(run("10.78.0.2", 0.9, false)),
            R"(PING 10.78.0.2 (10.78.0.2) from 10.78.0.1 pdp_ip0: 56(84) bytes of data.
64 bytes from 10.78.0.2: icmp_seq=1 ttl=64 time=T ms

--- 10.78.0.2 ping statistics ---
1 packets transmitted, 1 received, 0% packet loss, time Tms
rtt min/avg/max/mdev = T ms
)");
}

TEST_F(LinuxPingTestTest, PacketsDoNotLeaveThroughAnotherInterface) {
  // The other cable leads to 10.78.0.2, but this one is asked for, and nobody there has that address.
  ASSERT_TRUE(network->far("echo 1 > /proc/sys/net/ipv4/conf/all/arp_ignore"));
  run("10.78.0.2", 0.9, true);
  EXPECT_FALSE(success);
}

TEST_F(LinuxPingTestTest, LossIsAllThatAPeerThatDoesNotAnswerGives) {
  ASSERT_TRUE(network->far("echo 1 > /proc/sys/net/ipv4/icmp_echo_ignore_all"));
  EXPECT_EQ(timeless(run("10.77.0.2", 0.9)),
            R"(PING 10.77.0.2 (10.77.0.2) from 10.77.0.1 en0: 56(84) bytes of data.

--- 10.77.0.2 ping statistics ---
1 packets transmitted, 0 received, 100% packet loss, time Tms
)");
  EXPECT_FALSE(success);
  EXPECT_EQ(timeless(result), "1 packets transmitted, 0 received, 100% packet loss, time Tms");
}

TEST_F(LinuxPingTestTest, PartialLossIsASuccess) {
  prepare("10.77.0.2");
  start(3600);
  ASSERT_TRUE(waitForText("icmp_seq=1 "));
  ASSERT_TRUE(network->far("echo 1 > /proc/sys/net/ipv4/icmp_echo_ignore_all"));
  ASSERT_TRUE(waitForText("2 packets transmitted"));
  ping->stop();
  finish();
  EXPECT_TRUE(success);
  EXPECT_EQ(timeless(result), "2 packets transmitted, 1 received, 50% packet loss, time Tms");
}

TEST_F(LinuxPingTestTest, OneRequestASecond) {
  const auto begin = std::chrono::steady_clock::now();
  run("10.77.0.2", 2.5);
  EXPECT_GE(std::chrono::steady_clock::now() - begin, 2500ms);
  EXPECT_EQ(timeless(result), "3 packets transmitted, 3 received, 0% packet loss, time Tms");
}

/// Answers the first echo request that reaches this namespace: once as somebody who did not see our
/// data would, and once more as it should be. The kernel answers as well.
void answerBesidesTheKernel() {
  const Descriptor socket(::socket(AF_INET, SOCK_RAW | SOCK_CLOEXEC, IPPROTO_ICMP));
  const timeval limit{30, 0};
  ::setsockopt(socket.get(), SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof limit);
  std::vector<std::uint8_t> packet(2048);
  sockaddr_in asker{};
  socklen_t length = sizeof asker;
  const ssize_t size =
      ::recvfrom(socket.get(), packet.data(), packet.size(), 0, reinterpret_cast<sockaddr*>(&asker), &length);
  ASSERT_GT(size, 28);
  packet.resize(static_cast<std::size_t>(size));
  packet.erase(packet.begin(), packet.begin() + 20);
  packet[0] = 0;
  for (const int damage : {1, 0}) {
    std::vector<std::uint8_t> reply = packet;
    if (damage != 0) reply[8] ^= 0xFFU;  // the first byte of the nonce
    reply[2] = reply[3] = 0;
    const std::uint16_t sum = internetChecksum(reply);
    reply[2] = static_cast<std::uint8_t>(sum >> 8U);
    reply[3] = static_cast<std::uint8_t>(sum);
    ::sendto(socket.get(), reply.data(), reply.size(), 0, reinterpret_cast<const sockaddr*>(&asker), length);
  }
}

TEST_F(LinuxPingTestTest, DuplicatesAreFlaggedAndForgedAnswersPassedOver) {
  std::thread second = testing::threadIn(network->farName(), answerBesidesTheKernel);
  prepare("10.77.0.2");
  // The responder may open its socket after the first request: every later one serves as well.
  start(3600);
  second.join();
  EXPECT_TRUE(waitForText(" (DUP!)\n"));
  ping->stop();
  finish();
  EXPECT_TRUE(std::regex_search(timeless(text()), std::regex("icmp_seq=([0-9]+) ttl=64 time=T ms\n"
                                                             "64 bytes from 10.77.0.2: icmp_seq=\\1 ttl=64 "
                                                             "time=T ms \\(DUP!\\)\n")))
      << text();
  EXPECT_NE(result.find(" received, +1 duplicates, 0% packet loss"), std::string::npos) << result;
}

TEST_F(LinuxPingTestTest, NeighbourThatIsNotThereIsUnreachable) {
  // The kernel tells it through the loopback interface, so a socket bound to the device never hears.
  methods.binding = BindingChoice::addressOnly;
  prepare("10.77.0.99");
  start(3600);
  ASSERT_TRUE(waitForText("From 10.77.0.1 icmp_seq=1 Destination Host Unreachable\n"));
  ping->stop();
  finish();
  EXPECT_FALSE(success);
}

TEST_F(LinuxPingTestTest, RoutersRefusalIsShown) {
  ASSERT_TRUE(network->near("ip route add 203.0.113.0/24 via 10.77.0.2"));
  ASSERT_TRUE(
      network->far("echo 1 > /proc/sys/net/ipv4/ip_forward; ip route add unreachable 203.0.113.0/24"));
  const std::string output = run("203.0.113.5", 0.9);
  EXPECT_NE(output.find("From 10.77.0.2 icmp_seq=1 Destination Host Unreachable\n"), std::string::npos)
      << output;
  EXPECT_NE(result.find("0 received, +1 errors, 100% packet loss"), std::string::npos) << result;
  EXPECT_FALSE(success);
}

TEST_F(LinuxPingTestTest, NoRouteToTheGateway) {
  EXPECT_EQ(run(std::string(kDefaultGatewayAddress), 5),
            "ping: no route to a gateway: en0 has no default route\n");
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "no route to a gateway: en0 has no default route");
}

TEST_F(LinuxPingTestTest, NoRouteToAnAddressEndsAtOnce) {
  run("2001:db8::1", 3600);
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "no way to 2001:db8::1 over en0: Network is unreachable");
}

TEST_F(LinuxPingTestTest, GatewayIsThatOfTheInterface) {
  ASSERT_TRUE(
      network->near("ip route add default via 10.77.0.2 metric 100; "
                    "ip route add default via 10.78.0.2 metric 50"));
  const std::string output = timeless(run(std::string(kDefaultGatewayAddress), 0.9));
  EXPECT_EQ(output, R"(PING <default gateway> (10.77.0.2) from 10.77.0.1 en0: 56(84) bytes of data.
64 bytes from 10.77.0.2: icmp_seq=1 ttl=64 time=T ms

--- <default gateway> ping statistics ---
1 packets transmitted, 1 received, 0% packet loss, time Tms
rtt min/avg/max/mdev = T ms
)");
  EXPECT_TRUE(success);
}

TEST_F(LinuxPingTestTest, LinkLocalGatewayOfVersionSix) {
  ASSERT_TRUE(network->awaitVersionSix());
  ASSERT_TRUE(
      network->far("ip addr add fe80::2/64 dev far0 nodad") &&
      network->near("ip addr add fe80::1/64 dev en0 nodad; ip -6 route add default via fe80::2 dev en0"));
  run(std::string(kDefaultGatewayAddress), 0.9);
  EXPECT_TRUE(success) << text();
}

TEST_F(LinuxPingTestTest, AnswerOverVersionSixByRawAndDatagramSocket) {
  ASSERT_TRUE(network->awaitVersionSix());
  ASSERT_TRUE(network->near("echo 0 2147483647 > /proc/sys/net/ipv4/ping_group_range"));
  methods.program.clear();
  for (const bool datagram : {true, false}) {
    methods.datagramSocket = datagram;
    methods.rawSocket = !datagram;
    EXPECT_EQ(timeless(run("fd77::2", 0.9)), R"(PING fd77::2 (fd77::2) from fd77::1 en0: 56 data bytes
64 bytes from fd77::2: icmp_seq=1 ttl=64 time=T ms

--- fd77::2 ping statistics ---
1 packets transmitted, 1 received, 0% packet loss, time Tms
rtt min/avg/max/mdev = T ms
)");
    EXPECT_TRUE(success);
  }
}

TEST_F(LinuxPingTestTest, BindingByAddressIsSaidInTheText) {
  methods.binding = BindingChoice::addressOnly;
  for (const bool datagram : {true, false}) {
    methods.datagramSocket = datagram;
    ASSERT_TRUE(network->near("echo 0 2147483647 > /proc/sys/net/ipv4/ping_group_range"));
    EXPECT_EQ(timeless(run("10.77.0.2", 0.9)),
              R"(PING 10.77.0.2 (10.77.0.2) from 10.77.0.1 en0: 56(84) bytes of data.
(bound to the address 10.77.0.1 only: binding to en0 itself is not permitted)
64 bytes from 10.77.0.2: icmp_seq=1 ttl=64 time=T ms

--- 10.77.0.2 ping statistics ---
1 packets transmitted, 1 received, 0% packet loss, time Tms
rtt min/avg/max/mdev = T ms
)");
  }
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
  ASSERT_TRUE(queue.runNext(kDeadline));
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

TEST_F(LinuxPingTestTest, TwoTestsAtOnceDoNotTakeEachOthersAnswers) {
  ASSERT_TRUE(network->near("echo 1 0 > /proc/sys/net/ipv4/ping_group_range"));  // raw sockets hear all
  prepare("10.77.0.2");
  start(3600);
  const auto other = facility->makeTest("10.78.0.2", false);
  other->startWithTimeout(1.5, queue, [](std::string_view, bool) {});
  ASSERT_TRUE(queue.runNext(kDeadline));
  ping->stop();
  finish();
  EXPECT_EQ(text().find("10.78.0.2"), std::string::npos) << text();
  EXPECT_EQ(result.find("duplicates"), std::string::npos) << result;
}

TEST_F(LinuxPingTestTest, ResultFileFailuresNameTheErrorOnly) {
  prepare("10.77.0.2");
  std::string error;
  EXPECT_FALSE(ping->writeResultsToFile(directory / "missing/file", error));
  EXPECT_EQ(error, "No such file or directory");
  std::filesystem::create_symlink("/dev/null", directory / "link");
  EXPECT_FALSE(ping->writeResultsToFile(directory / "link", error));
  EXPECT_EQ(error, "Too many levels of symbolic links");
  start(0.2);
  finish();
  EXPECT_FALSE(ping->writeResultsToFile("/dev/full", error));
  EXPECT_EQ(error, "No space left on device");
}

TEST_F(LinuxPingTestTest, LongIntervalIsAMinute) {
  prepare("10.77.0.2");
  EXPECT_EQ(ping->longTimeInterval(), 60.0);
}

}  // namespace
}  // namespace zal
