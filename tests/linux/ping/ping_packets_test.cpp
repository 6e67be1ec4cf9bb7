#include <netinet/in.h>
#include <sys/socket.h>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/ping/icmp_packet.h"
#include "tests/linux/ping/ping_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

class PingPacketsTest : public testing::PingFixture {};

constexpr const char* kOneAnswer = R"(PING 10.77.0.2 (10.77.0.2) from 10.77.0.1 en0: 56(84) bytes of data.
64 bytes from 10.77.0.2: icmp_seq=1 ttl=64 time=T ms

--- 10.77.0.2 ping statistics ---
1 packets transmitted, 1 received, 0% packet loss, time Tms
rtt min/avg/max/mdev = T ms
)";

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

TEST_F(PingPacketsTest, AnswerThroughADatagramSocket) {
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

TEST_F(PingPacketsTest, AnswerThroughARawSocketWhereDatagramSocketsAreRefused) {
  ASSERT_TRUE(network->near("echo 1 0 > /proc/sys/net/ipv4/ping_group_range"));
  methods.program.clear();
  EXPECT_EQ(timeless(run("10.77.0.2", 0.9)), kOneAnswer);
  EXPECT_TRUE(success);
  EXPECT_EQ(log.lines, std::vector<std::string>{"log:Ping: Pinging 10.77.0.2 over en0 through a raw socket"});
}

TEST_F(PingPacketsTest, CellularTestsUseTheCellularInterface) {
  EXPECT_EQ(timeless(run("10.78.0.2", 0.9, false)),
            R"(PING 10.78.0.2 (10.78.0.2) from 10.78.0.1 pdp_ip0: 56(84) bytes of data.
64 bytes from 10.78.0.2: icmp_seq=1 ttl=64 time=T ms

--- 10.78.0.2 ping statistics ---
1 packets transmitted, 1 received, 0% packet loss, time Tms
rtt min/avg/max/mdev = T ms
)");
}

TEST_F(PingPacketsTest, PacketsDoNotLeaveThroughAnotherInterface) {
  // The other cable leads to 10.78.0.2, but this one is asked for, and nobody there has that address.
  ASSERT_TRUE(network->far("echo 1 > /proc/sys/net/ipv4/conf/all/arp_ignore"));
  run("10.78.0.2", 0.9, true);
  EXPECT_FALSE(success);
}

TEST_F(PingPacketsTest, LossIsAllThatAPeerThatDoesNotAnswerGives) {
  ASSERT_TRUE(network->far("echo 1 > /proc/sys/net/ipv4/icmp_echo_ignore_all"));
  EXPECT_EQ(timeless(run("10.77.0.2", 0.9)),
            R"(PING 10.77.0.2 (10.77.0.2) from 10.77.0.1 en0: 56(84) bytes of data.

--- 10.77.0.2 ping statistics ---
1 packets transmitted, 0 received, 100% packet loss, time Tms
)");
  EXPECT_FALSE(success);
  EXPECT_EQ(timeless(result), "1 packets transmitted, 0 received, 100% packet loss, time Tms");
}

TEST_F(PingPacketsTest, PartialLossIsASuccess) {
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

TEST_F(PingPacketsTest, OneRequestASecond) {
  const auto begin = std::chrono::steady_clock::now();
  run("10.77.0.2", 2.5);
  EXPECT_GE(std::chrono::steady_clock::now() - begin, 2000ms);  // the last request goes out then
  EXPECT_EQ(timeless(result), "3 packets transmitted, 3 received, 0% packet loss, time Tms");
}

TEST_F(PingPacketsTest, DuplicatesAreFlaggedAndForgedAnswersPassedOver) {
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

TEST_F(PingPacketsTest, NeighbourThatIsNotThereIsUnreachable) {
  // The kernel tells it through the loopback interface, so a socket bound to the device never hears.
  methods.binding = BindingChoice::addressOnly;
  prepare("10.77.0.99");
  start(3600);
  ASSERT_TRUE(waitForText("From 10.77.0.1 icmp_seq=1 Destination Host Unreachable\n"));
  ping->stop();
  finish();
  EXPECT_FALSE(success);
}

TEST_F(PingPacketsTest, RoutersRefusalIsShown) {
  ASSERT_TRUE(network->near("ip route add 203.0.113.0/24 via 10.77.0.2"));
  ASSERT_TRUE(
      network->far("echo 1 > /proc/sys/net/ipv4/ip_forward; ip route add unreachable 203.0.113.0/24"));
  const std::string output = run("203.0.113.5", 0.9);
  EXPECT_NE(output.find("From 10.77.0.2 icmp_seq=1 Destination Host Unreachable\n"), std::string::npos)
      << output;
  EXPECT_NE(result.find("0 received, +1 errors, 100% packet loss"), std::string::npos) << result;
  EXPECT_FALSE(success);
}

TEST_F(PingPacketsTest, NoRouteToTheGateway) {
  EXPECT_EQ(run(std::string(kDefaultGatewayAddress), 5),
            "ping: no route to a gateway: en0 has no default route\n");
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "no route to a gateway: en0 has no default route");
}

TEST_F(PingPacketsTest, NoRouteToAnAddressEndsAtOnce) {
  run("2001:db8::1", 3600);
  EXPECT_FALSE(success);
  EXPECT_EQ(result, "no way to 2001:db8::1 over en0: Network is unreachable");
}

TEST_F(PingPacketsTest, GatewayIsThatOfTheInterface) {
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

TEST_F(PingPacketsTest, LinkLocalGatewayOfVersionSix) {
  ASSERT_TRUE(network->awaitVersionSix());
  ASSERT_TRUE(
      network->far("ip addr add fe80::2/64 dev far0 nodad") &&
      network->near("ip addr add fe80::1/64 dev en0 nodad; ip -6 route add default via fe80::2 dev en0"));
  run(std::string(kDefaultGatewayAddress), 0.9);
  EXPECT_TRUE(success) << text();
}

TEST_F(PingPacketsTest, AnswerOverVersionSixByRawAndDatagramSocket) {
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

TEST_F(PingPacketsTest, BindingByAddressIsSaidInTheText) {
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

TEST_F(PingPacketsTest, TwoTestsAtOnceDoNotTakeEachOthersAnswers) {
  ASSERT_TRUE(network->near("echo 1 0 > /proc/sys/net/ipv4/ping_group_range"));  // raw sockets hear all
  prepare("10.77.0.2");
  start(3600);
  const auto other = facility->makeTest("10.78.0.2", false);
  other->startWithTimeout(1.5, queue, [](std::string_view, bool) {});
  ASSERT_TRUE(queue.runNext(testing::kDeadline));
  ping->stop();
  finish();
  EXPECT_EQ(text().find("10.78.0.2"), std::string::npos) << text();
  EXPECT_EQ(result.find("duplicates"), std::string::npos) << result;
}

}  // namespace
}  // namespace zal
