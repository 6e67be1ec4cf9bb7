#include "tests/cli/tool_fixture.h"

namespace zal::testing {
namespace {

class PreferenceCommandsTest : public ToolFixture {};

TEST_F(PreferenceCommandsTest, SetStoresAndTellsEverybody) {
  EXPECT_EQ(run({"prefs", "set", "CallLogging", "true"}), 0);
  EXPECT_EQ(out, "");
  EXPECT_EQ(machine.switches, (std::map<std::string, bool, std::less<>>{{"CallLogging", true}}));
  EXPECT_EQ(machine.posted, std::vector<std::string>{"kLirraSyncLoggingPrefs"});
}

TEST_F(PreferenceCommandsTest, WhatWasSetIsGot) {
  EXPECT_EQ(run({"prefs", "get", "CallLogging"}), 0);
  EXPECT_EQ(out, "false\n");
  EXPECT_EQ(run({"prefs", "get", "CallLogging", "--json"}), 0);
  EXPECT_EQ(out, "{\"key\": \"CallLogging\", \"value\": false, \"stored\": false}\n");
  EXPECT_EQ(run({"prefs", "set", "CallLogging", "on", "--json"}), 0);
  EXPECT_EQ(out, "{\"key\": \"CallLogging\", \"value\": true, \"stored\": true}\n");
  EXPECT_EQ(run({"prefs", "get", "CallLogging"}), 0);
  EXPECT_EQ(out, "true\n");
}

TEST_F(PreferenceCommandsTest, ListShowsEverySwitch) {
  machine.switches = {{"CallLogging", true}, {"pingtest", false}};
  EXPECT_EQ(run({"prefs", "list"}), 0);
  EXPECT_EQ(out,
            "CallLogging               true     sessions are logged\n"
            "VerboseCallLogging        not set  sessions are logged too\n"
            "ConsoleOutput             not set  new sessions echo their checkpoints\n"
            "ConsoleOutputVerbose      not set  new sessions echo checkpoints and descriptions\n"
            "ConsoleOutputTorvik       not set  log and event records are echoed\n"
            "ConsoleOutputRegistration not set  read, without effect\n"
            "ConsoleOutputLocalPreview not set  read, without effect\n"
            "pingtest                  false    every begin runs the ping tests\n");
}

TEST_F(PreferenceCommandsTest, UnknownSwitchIsNotFound) {
  EXPECT_EQ(run({"prefs", "set", "Calllogging", "true"}), 3);
  EXPECT_EQ(run({"prefs", "get", "Calllogging"}), 3);
  EXPECT_EQ(err,
            "lirractl: there is no preference Calllogging\n"
            "  There are: CallLogging, VerboseCallLogging, ConsoleOutput, ConsoleOutputVerbose, "
            "ConsoleOutputTorvik, "
            "ConsoleOutputRegistration, ConsoleOutputLocalPreview, pingtest.\n");
  EXPECT_TRUE(machine.switches.empty());
}

TEST_F(PreferenceCommandsTest, TroubleWithTheFileIsTold) {
  machine.storeTrouble = "disk full";
  EXPECT_EQ(run({"prefs", "set", "CallLogging", "true"}), 4);
  EXPECT_EQ(err, "lirractl: not stored: disk full\n  The switches are in /config/com.vendel.logging.toml.\n");
  EXPECT_TRUE(machine.posted.empty());
}

TEST_F(PreferenceCommandsTest, AgentThatCannotBeToldIsTold) {
  machine.postTrouble = "no runtime directory";
  EXPECT_EQ(run({"prefs", "set", "CallLogging", "true"}), 1);
  EXPECT_EQ(err,
            "lirractl: stored, but the agent was not told: no runtime directory\n"
            "  A running agent reads it when a session begins or ends, or on SIGHUP.\n");
}

}  // namespace
}  // namespace zal::testing
