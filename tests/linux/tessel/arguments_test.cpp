#include "platform/linux/tessel/arguments.h"

#include <gtest/gtest.h>

namespace zal::tessel {
namespace {

using namespace std::chrono_literals;

std::string troubleWith(const std::vector<std::string>& words) {
  const auto parsed = parseArguments(words);
  const auto* trouble = std::get_if<std::string>(&parsed);
  return trouble != nullptr ? *trouble : "none";
}

TEST(TesselArgumentsTest, WithoutAnyEverythingIsPrinted) {
  const auto arguments = std::get<Arguments>(parseArguments({}));
  EXPECT_FALSE(arguments.follow);
  EXPECT_FALSE(arguments.lookBack);
  EXPECT_FALSE(arguments.namesASource());
}

TEST(TesselArgumentsTest, FollowingAndLookingBackAreToldApart) {
  EXPECT_TRUE(std::get<Arguments>(parseArguments({"-w"})).follow);
  EXPECT_EQ(std::get<Arguments>(parseArguments({"-k", "Time", "ge", "-5m"})).lookBack, 300s);
  EXPECT_EQ(troubleWith({"-w", "-k", "Time", "ge", "-5m"}), "-w and -k exclude each other");
}

TEST(TesselArgumentsTest, AgesHaveFourUnits) {
  EXPECT_EQ(parseAge("-90s"), 90s);
  EXPECT_EQ(parseAge("-10m"), 600s);
  EXPECT_EQ(parseAge("-2h"), 7200s);
  EXPECT_EQ(parseAge("-1d"), 86400s);
  EXPECT_EQ(parseAge("-0s"), 0s);
  EXPECT_EQ(parseAge("-999999999d"), 999999999 * 24h);
}

TEST(TesselArgumentsTest, AgesOfAnyOtherFormAreNone) {
  for (const char* text :
       {"", "-", "5m", "-m", "-5", "-5M", "-5 m", "--5m", "-+5m", "-5.5m", "-1234567890s"}) {
    EXPECT_EQ(parseAge(text), std::nullopt) << text;
  }
}

TEST(TesselArgumentsTest, WrongUsageIsNamed) {
  EXPECT_EQ(troubleWith({"-x"}), "\"-x\" is not understood");
  EXPECT_EQ(troubleWith({"file"}), "\"file\" is not understood");
  EXPECT_EQ(troubleWith({"-k"}), "-k takes three words, such as \"Time ge -5m\"");
  EXPECT_EQ(troubleWith({"-k", "Level", "ge", "-5m"}), "-k takes three words, such as \"Time ge -5m\"");
  EXPECT_EQ(troubleWith({"-k", "Time", "le", "-5m"}), "-k takes three words, such as \"Time ge -5m\"");
  EXPECT_EQ(troubleWith({"-k", "Time", "ge"}), "\"\" is no age such as -30s, -5m, -2h or -1d");
  EXPECT_EQ(troubleWith({"-k", "Time", "ge", "now"}), "\"now\" is no age such as -30s, -5m, -2h or -1d");
  EXPECT_EQ(troubleWith({"--syslog"}), "--syslog needs a path");
}

TEST(TesselArgumentsTest, PlacesAreTakenAsGiven) {
  const auto arguments = std::get<Arguments>(
      parseArguments({"--journal-directory", "/a", "--syslog", "/b", "--kmsg", "/c", "-w"}));
  EXPECT_EQ(arguments.journalDirectory, "/a");
  EXPECT_EQ(arguments.syslogFile, "/b");
  EXPECT_EQ(arguments.kernelLog, "/c");
  EXPECT_TRUE(arguments.namesASource());
}

}  // namespace
}  // namespace zal::tessel
