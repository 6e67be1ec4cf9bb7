#include <cstdlib>
#include <sstream>

#include <gtest/gtest.h>

#include "cli/host.h"
#include "cli/tool.h"
#include "platform/client_channel.h"
#include "platform/linux/alerts/alert_record.h"
#include "platform/linux/progress/progress_record.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

/// The real machine, told by its environment to stay in a directory of the test's own.
class ThisMachineTest : public ::testing::Test {
 protected:
  ThisMachineTest() {
    writeFile(directory / "lirra.toml",
              "[roots]\nRuntimeRoot = \"" + (directory / "run") + "\"\nnonsense = 1\n");
    set("LIRRA_CONFIG", directory / "lirra.toml");
    set("LIRRA_SOCKET", directory / "agent");
  }
  ~ThisMachineTest() override {
    for (const auto& [name, value] : before) {
      if (value) {
        ::setenv(name.c_str(), value->c_str(), 1);
      } else {
        ::unsetenv(name.c_str());
      }
    }
  }
  void set(const std::string& name, const std::optional<std::string>& value) {
    const char* const old = ::getenv(name.c_str());
    before.emplace(name, old != nullptr ? std::optional<std::string>(old) : std::nullopt);
    if (value) {
      ::setenv(name.c_str(), value->c_str(), 1);
    } else {
      ::unsetenv(name.c_str());
    }
  }
  int run(const std::vector<std::string>& arguments) {
    std::ostringstream errStream;
    std::ostringstream outStream;
    std::istringstream in;
    const auto machine = thisMachine(errStream);
    const int code = runTool(arguments, *machine, in, outStream, errStream);
    out = outStream.str();
    err = errStream.str();
    return code;
  }

  TemporaryDirectory directory;
  std::map<std::string, std::optional<std::string>> before;
  std::string out;
  std::string err;
};

TEST_F(ThisMachineTest, PreferencesAreStoredAndPosted) {
  EXPECT_EQ(run({"prefs", "set", "CallLogging", "true"}), 0) << err;
  EXPECT_EQ(readFile(directory / "com.vendel.logging.toml"), "CallLogging = true\n");
  EXPECT_EQ(listTree(directory / "run"), "notifications/\nnotifications/kLirraSyncLoggingPrefs\n");
  EXPECT_EQ(run({"prefs", "get", "CallLogging"}), 0);
  EXPECT_EQ(out, "true\n");
}

TEST_F(ThisMachineTest, BrokenPreferenceFileIsToldAndKept) {
  writeFile(directory / "com.vendel.logging.toml", "CallLogging = = true\n");
  EXPECT_EQ(run({"prefs", "set", "CallLogging", "true"}), 4);
  EXPECT_EQ(err.find("lirractl: not stored: "), 0U) << err;
  EXPECT_EQ(readFile(directory / "com.vendel.logging.toml"), "CallLogging = = true\n");
}

TEST_F(ThisMachineTest, SettingsComeFromTheConfiguration) {
  std::ostringstream ignored;
  const auto machine = thisMachine(ignored);
  EXPECT_EQ(machine->settings().configurationFile, directory / "lirra.toml");
  EXPECT_EQ(machine->settings().roots.RuntimeRoot, directory / "run");
  EXPECT_EQ(machine->settings().warnings.size(), 1U);
  EXPECT_EQ(machine->settings().preferenceFile, directory / "com.vendel.logging.toml");
}

TEST_F(ThisMachineTest, AlertsAreThoseOfTheRuntimeDirectory) {
  set("TZ", "UTC0");
  AlertRecord record;
  record.alert.title = "Vistel Logging";
  record.alert.message = "Please describe the problem briefly";
  record.alert.defaultButton = "OK";
  record.alert.alternateButton = "Cancel";
  record.alert.textField.emplace();
  record.posted = WallTime(std::chrono::milliseconds(1714651387251));
  record.agent = ProcessIdentity::ofThisProcess();
  writeFile(directory / "run/alerts/3.toml", alertRecordText(record));
  EXPECT_EQ(run({"alerts"}), 0) << err;
  EXPECT_EQ(out,
            "3  Vistel Logging  (waiting, 2024-05-02 12:03:07)\n"
            "    Please describe the problem briefly\n"
            "    default: OK   alternate: Cancel   cancel   (takes --text)\n");
  EXPECT_EQ(run({"alerts", "answer", "3", "--text", "no sound"}), 0) << err;
  EXPECT_EQ(readFile(directory / "run/alerts/3.answer"), "button = \"default\"\ntext = \"no sound\"\n");
  EXPECT_EQ(run({"alerts", "answer", "3"}), 4);
  EXPECT_EQ(err, "lirractl: not answered: Alert 3 has been answered a moment ago.\n");
}

TEST_F(ThisMachineTest, DumpsAreThoseOfTheRuntimeDirectory) {
  const WallTime began{std::chrono::milliseconds(1714651387251)};
  const auto later = [&](int milliseconds) { return began + std::chrono::milliseconds(milliseconds); };
  writeFile(directory / "run/dumps/1-1.progress",
            progressBeginText("Vistel", "/r/Vistel/Vistel-Log (now)", {"Network state", "Archive"}, began,
                              ProcessIdentity::ofThisProcess()) +
                progressStepText(1, later(250)) + progressMissingText("stackshot", "no service") +
                progressFailedText("no archive", later(900)));
  std::ostringstream ignored;
  const std::vector<DumpView> dumps = thisMachine(ignored)->dumps();
  ASSERT_EQ(dumps.size(), 1U);
  EXPECT_EQ(dumps[0].name, "1-1.progress");
  EXPECT_EQ(dumps[0].service, "Vistel");
  EXPECT_EQ(dumps[0].directory, "/r/Vistel/Vistel-Log (now)");
  ASSERT_EQ(dumps[0].steps.size(), 2U);
  EXPECT_EQ(dumps[0].steps[0].name, "Network state");
  EXPECT_EQ(dumps[0].steps[0].began, std::chrono::milliseconds(250));
  EXPECT_EQ(dumps[0].steps[1].began, std::nullopt);
  EXPECT_EQ(dumps[0].currentStep, 1U);
  ASSERT_EQ(dumps[0].missing.size(), 1U);
  EXPECT_EQ(dumps[0].missing[0].what, "stackshot");
  EXPECT_EQ(dumps[0].missing[0].why, "no service");
  EXPECT_EQ(dumps[0].state, DumpView::State::failed);
  EXPECT_EQ(dumps[0].reason, "no archive");
}

TEST_F(ThisMachineTest, ClientLibraryAndConfigurationAgreeWhereTheAgentListens) {
  const auto configured = [] {
    std::ostringstream ignored;
    return thisMachine(ignored)->settings().socketPath;
  };
  EXPECT_EQ(agentAddress(), directory / "agent");
  EXPECT_EQ(configured(), agentAddress());
  set("LIRRA_SOCKET", "");
  for (const char* runtime : {"/run/user/7", "/run/user/7///", "/", "relative", ""}) {
    set("XDG_RUNTIME_DIR", runtime);
    EXPECT_EQ(configured(), agentAddress()) << runtime;
  }
  set("XDG_RUNTIME_DIR", "/run/user/7/");
  EXPECT_EQ(agentAddress(), "/run/user/7/com.vendel.lirra");
}

}  // namespace
}  // namespace zal::testing
