#include "platform/linux/ping/route_table.h"

#include <arpa/inet.h>
#include <gtest/gtest.h>

#include <random>
#include <string>

namespace zal {
namespace {

/// Eight hexadecimal digits as the kernel of this machine prints an address.
std::string hex(const char* address) {
  in_addr parsed{};
  ::inet_pton(AF_INET, address, &parsed);
  char text[9];
  std::snprintf(text, sizeof text, "%08X", static_cast<unsigned>(parsed.s_addr));
  return text;
}

std::string line(const char* interface, const char* destination, const char* gateway, const char* flags,
                 int metric, const char* mask) {
  return std::string(interface) + "\t" + hex(destination) + "\t" + hex(gateway) + "\t" + flags + "\t0\t0\t" +
         std::to_string(metric) + "\t" + hex(mask) + "\t0\t0\t0   \n";
}

const std::string kHeading =
    "Iface\tDestination\tGateway \tFlags\tRefCnt\tUse\tMetric\tMask\t\tMTU\tWindow\tIRTT\n";
const std::string kZero(32, '0');

TEST(RouteTableTest, DefaultRouteOfTheInterfaceWithTheLowestMetric) {
  const std::string table = kHeading + line("en0", "0.0.0.0", "10.0.0.9", "0003", 600, "0.0.0.0") +
                            line("en0", "0.0.0.0", "10.0.0.1", "0003", 100, "0.0.0.0") +
                            line("pdp_ip0", "0.0.0.0", "10.1.0.1", "0003", 50, "0.0.0.0") +
                            line("en0", "10.0.0.0", "0.0.0.0", "0001", 0, "255.255.255.0");
  const auto route = defaultRouteV4(table, "en0");
  ASSERT_TRUE(route && route->gateway);
  EXPECT_EQ(route->gateway->to_string(), "10.0.0.1");
  EXPECT_EQ(route->metric, 100U);
  EXPECT_EQ(defaultRouteV4(table, "pdp_ip0")->gateway->to_string(), "10.1.0.1");
  EXPECT_FALSE(defaultRouteV4(table, "en"));
}

TEST(RouteTableTest, PointToPointRouteHasNoGateway) {
  const auto route =
      defaultRouteV4(kHeading + line("pdp_ip0", "0.0.0.0", "0.0.0.0", "0001", 0, "0.0.0.0"), "pdp_ip0");
  ASSERT_TRUE(route);
  EXPECT_FALSE(route->gateway);
}

TEST(RouteTableTest, HalfTheWorldDownRoutesAndRejectingOnesAreNoDefault) {
  EXPECT_FALSE(defaultRouteV4(line("en0", "0.0.0.0", "10.0.0.1", "0003", 0, "128.0.0.0"), "en0"));
  EXPECT_FALSE(defaultRouteV4(line("en0", "0.0.0.0", "10.0.0.1", "0002", 0, "0.0.0.0"), "en0"));
  EXPECT_FALSE(defaultRouteV4(line("en0", "0.0.0.0", "10.0.0.1", "0203", 0, "0.0.0.0"), "en0"));
}

TEST(RouteTableTest, VersionSixTable) {
  const std::string gateway = "fd770000000000000000000000000002";
  const std::string table =
      gateway + " 40 " + kZero + " 00 " + kZero + " 00000100 00000001 00000000 00000001      en0\n" +  //
      kZero + " 00 " + kZero + " 00 " + kZero + " ffffffff 00000001 00000000 00200200       lo\n" +    //
      kZero + " 00 " + kZero + " 00 " + gateway + " 00000400 00000001 00000000 00000003      en0\n";
  const auto route = defaultRouteV6(table, "en0");
  ASSERT_TRUE(route && route->gateway);
  EXPECT_EQ(route->gateway->to_string(), "fd77::2");
  EXPECT_EQ(route->metric, 0x400U);
  EXPECT_FALSE(defaultRouteV6(table, "lo"));
}

TEST(RouteTableTest, NonsenseIsPassedOver) {
  EXPECT_FALSE(defaultRouteV4("en0\nen0 x y z 1 2 3 4 5\n\n\t \n", "en0"));
  EXPECT_FALSE(
      defaultRouteV6("x 00 y 00 z 1 2 3 4 en0\n" + kZero + " 00 " + kZero + " 00 short 1 2 3 3 en0", "en0"));
  std::mt19937 random(7);
  const std::string alphabet = "0123456789abcdefG \t\nen0";
  std::uniform_int_distribution<std::size_t> letter(0, alphabet.size() - 1), length(0, 200);
  for (int round = 0; round < 5000; ++round) {
    std::string table(length(random), ' ');
    for (auto& c : table) c = alphabet[letter(random)];
    (void)defaultRouteV4(table, "en0");
    (void)defaultRouteV6(table, "en0");
  }
}

}  // namespace
}  // namespace zal
