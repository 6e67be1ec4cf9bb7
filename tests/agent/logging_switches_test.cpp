#include "agent/logging_switches.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/fake_services.h"

namespace zal {
namespace {

using ::testing::ElementsAre;

class LoggingSwitchesTest : public ::testing::Test {
 protected:
  bool readWith(const std::string& key) {
    preferences.stored = {{key, true}};
    return switches.read(preferences);
  }
  testing::FakePreferences preferences;
  LoggingSwitches switches;
};

TEST_F(LoggingSwitchesTest, AreAllOffBeforeTheFirstReadAndWithNoPreferencesSet) {
  for (int reads = 0; reads < 2; ++reads) {
    EXPECT_FALSE(switches.VerboseCallLogging);
    EXPECT_FALSE(switches.CallLogging);
    EXPECT_FALSE(switches.ConsoleOutput);
    EXPECT_FALSE(switches.ConsoleOutputVerbose);
    EXPECT_FALSE(switches.ConsoleOutputTorvik);
    EXPECT_FALSE(switches.isCallLoggingEnabled());
    EXPECT_FALSE(switches.read(preferences));
  }
}

TEST_F(LoggingSwitchesTest, ReadsSevenKeysInOrderAfterOneSynchronization) {
  switches.read(preferences);
  EXPECT_EQ(preferences.synchronizations, 1);
  EXPECT_THAT(preferences.readKeys,
              ElementsAre("VerboseCallLogging", "CallLogging", "ConsoleOutput", "ConsoleOutputVerbose",
                          "ConsoleOutputRegistration", "ConsoleOutputTorvik", "ConsoleOutputLocalPreview"));
}

TEST_F(LoggingSwitchesTest, EitherCallLoggingSwitchEnablesCallLogging) {
  readWith("CallLogging");
  EXPECT_TRUE(switches.isCallLoggingEnabled());
  EXPECT_FALSE(switches.VerboseCallLogging);
  readWith("VerboseCallLogging");
  EXPECT_TRUE(switches.isCallLoggingEnabled());
  EXPECT_FALSE(switches.CallLogging);
}

TEST_F(LoggingSwitchesTest, ConsoleOutputAloneTurnsOnCheckpointEchoesOnly) {
  readWith("ConsoleOutput");
  EXPECT_TRUE(switches.isConsoleOutput());
  EXPECT_FALSE(switches.isVerboseConsoleOutput());
}

TEST_F(LoggingSwitchesTest, ConsoleOutputVerboseAloneTurnsOnBothEchoes) {
  readWith("ConsoleOutputVerbose");
  EXPECT_TRUE(switches.isConsoleOutput());
  EXPECT_TRUE(switches.isVerboseConsoleOutput());
}

TEST_F(LoggingSwitchesTest, ConsoleOutputRegistrationAloneChangesNothing) {
  EXPECT_FALSE(readWith("ConsoleOutputRegistration"));
  EXPECT_FALSE(switches.isCallLoggingEnabled());
  EXPECT_FALSE(switches.isConsoleOutput());
  EXPECT_FALSE(switches.ConsoleOutputTorvik);
}

TEST_F(LoggingSwitchesTest, TheLocalPreviewSwitchIsOnlyHandedBack) {
  EXPECT_TRUE(readWith("ConsoleOutputLocalPreview"));
  EXPECT_FALSE(switches.isConsoleOutput());
  EXPECT_FALSE(switches.isCallLoggingEnabled());
}

TEST_F(LoggingSwitchesTest, AKeyThatWasRemovedIsOffAfterTheNextRead) {
  readWith("ConsoleOutputTorvik");
  EXPECT_TRUE(switches.ConsoleOutputTorvik);
  preferences.stored.clear();
  EXPECT_TRUE(switches.ConsoleOutputTorvik);
  switches.read(preferences);
  EXPECT_FALSE(switches.ConsoleOutputTorvik);
}

}  // namespace
}  // namespace zal
