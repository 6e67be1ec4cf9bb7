#include <cstdlib>
#include <sstream>

#include <gtest/gtest.h>

#include "cli/host.h"
#include "cli/tool.h"
#include "platform/client_channel.h"
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
