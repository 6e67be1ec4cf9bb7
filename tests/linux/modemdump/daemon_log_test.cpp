#include "platform/linux/modemdump/daemon_log.h"

#include <gtest/gtest.h>

namespace zal::modemdump {
namespace {

std::string words(const std::vector<std::string>& all) {
  std::string text;
  for (const std::string& word : all) text += word + '\0';
  return text;
}

TEST(DaemonLogTest, CommandLineTellsLevelAndFile) {
  const auto usual = logSettings(words({"/usr/sbin/ModemManager"}));
  EXPECT_EQ(usual.level, "INFO");
  EXPECT_EQ(usual.file, "");
  const auto set = logSettings(words({"ModemManager", "--log-level", "WARN", "--log-file=/var/log/mm"}));
  EXPECT_EQ(set.level, "WARN");
  EXPECT_EQ(set.file, "/var/log/mm");
  EXPECT_EQ(logSettings(words({"ModemManager", "--debug"})).level, "DEBUG");
  EXPECT_EQ(logSettings(words({"ModemManager", "--log-file", "relative"})).file, "");
  EXPECT_EQ(logSettings("").level, "INFO");
}

TEST(DaemonLogTest, OnlyTheLinesOfModemDaemonsAreTaken) {
  EXPECT_EQ(modemLines("a host cron[1]: x\nb host ModemManager[2]: y\n\nc host ofonod[3]: cut off"),
            "b host ModemManager[2]: y\nc host ofonod[3]: cut off\n");
  EXPECT_EQ(modemLines(""), "");
}

}  // namespace
}  // namespace zal::modemdump
