#include <cstdlib>

#include <gmock/gmock.h>

#include "tests/support/private_bus.h"

namespace zal::testing {
namespace {

using ::testing::HasSubstr;

/// What `make install` puts on the host for the agent's start, below a directory of the test's own.
class InstalledFilesTest : public ::testing::Test {
 protected:
  void SetUp() override {
    if (outputOf({"cmake", "--version"}).find("version") == std::string::npos) {
      GTEST_SKIP() << "cmake is not installed";
    }
    printed = outputOf({"cmake", "--install", ZAL_BUILD_DIRECTORY, "--component", "host"},
                       {{"DESTDIR", root.path()}});
  }
  /// The file's text by its path below the prefix.
  [[nodiscard]] std::string text(const std::string& path) const {
    return readFile(root.path() + ZAL_INSTALL_PREFIX "/" + path);
  }

  TemporaryDirectory root;
  std::string printed;
};

TEST_F(InstalledFilesTest, LieBelowTheDestinationDirectoryAndNowhereElse) {
  EXPECT_EQ(listTree(root.path() + ZAL_INSTALL_PREFIX),
            "lib/\n"
            "lib/systemd/\n"
            "lib/systemd/system/\n"
            "lib/systemd/system/zalloggingagent.service\n"
            "lib/systemd/system/zalloggingagent.socket\n"
            "lib/systemd/user/\n"
            "lib/systemd/user/zalloggingagent.service\n"
            "lib/systemd/user/zalloggingagent.socket\n"
            "share/\n"
            "share/dbus-1/\n"
            "share/dbus-1/services/\n"
            "share/dbus-1/services/com.vendel.lirra.service\n"
            "share/dbus-1/system-services/\n"
            "share/dbus-1/system-services/com.vendel.lirra.service\n"
            "share/dbus-1/system.d/\n"
            "share/dbus-1/system.d/com.vendel.lirra.conf\n"
            "share/polkit-1/\n"
            "share/polkit-1/rules.d/\n"
            "share/polkit-1/rules.d/60-com.vendel.lirra.rules\n")
      << printed;
}

TEST_F(InstalledFilesTest, AllWaysOfStartingLeadToTheOneProgram) {
  const std::string program = "=" ZAL_INSTALL_PREFIX "/bin/zalloggingagent\n";
  for (const char* path :
       {"lib/systemd/system/zalloggingagent.service", "lib/systemd/user/zalloggingagent.service"}) {
    EXPECT_THAT(text(path), HasSubstr("ExecStart" + program));
    EXPECT_THAT(text(path), HasSubstr("\nKillMode=process\n"));
    EXPECT_THAT(text(path), HasSubstr("Requires=zalloggingagent.socket\n"));
  }
  for (const char* path : {"share/dbus-1/services/com.vendel.lirra.service",
                           "share/dbus-1/system-services/com.vendel.lirra.service"}) {
    EXPECT_THAT(text(path), HasSubstr("Exec" + program));
    EXPECT_THAT(text(path), HasSubstr("Name=com.vendel.lirra\n"));
    EXPECT_THAT(text(path), HasSubstr("SystemdService=zalloggingagent.service\n"));
  }
  EXPECT_THAT(text("lib/systemd/system/zalloggingagent.socket"),
              HasSubstr("ListenStream=/run/com.vendel.lirra\n"));
  EXPECT_THAT(text("lib/systemd/user/zalloggingagent.socket"),
              HasSubstr("ListenStream=%t/com.vendel.lirra\n"));
}

TEST_F(InstalledFilesTest, TheSystemUnitIsUnderstoodAndAsContainedAsTheCommandsAllow) {
  if (outputOf({"systemd-analyze", "--version"}).find("systemd") == std::string::npos) {
    GTEST_SKIP() << "systemd-analyze is not installed";
  }
  // Whoever checks a unit wants its program installed.
  std::string unit = text("lib/systemd/system/zalloggingagent.service");
  const std::string program = ZAL_INSTALL_PREFIX "/bin/zalloggingagent";
  ASSERT_NE(unit.find(program), std::string::npos);
  unit.replace(unit.find(program), program.size(), "/bin/true");
  const std::string copy = root / "zalloggingagent.service";
  writeFile(copy, unit);
  writeFile(root / "zalloggingagent.socket", text("lib/systemd/system/zalloggingagent.socket"));
  EXPECT_EQ(outputOf({"sh", "-c", "systemd-analyze verify '" + copy + "' 2>&1 && echo understood"}),
            "understood");
  // 4.6 of 10; without the sandbox it was 9.1.
  EXPECT_THAT(outputOf({"sh", "-c",
                        "systemd-analyze security --offline=yes --no-pager --threshold=46 '" + copy +
                            "' > /dev/null 2>&1 && echo contained"}),
              HasSubstr("contained"));
  for (const char* kept : {"CAP_NET_RAW", "CAP_SYS_PTRACE", "CAP_SYSLOG", "CAP_KILL"}) {
    EXPECT_THAT(unit, HasSubstr(kept));
  }
  EXPECT_THAT(unit, ::testing::Not(HasSubstr("PrivateTmp")));
}

TEST_F(InstalledFilesTest, ThePolkitRuleLetsTheAgentsUserDoTheFourThingsAndNothingElse) {
  if (!outputOf({"node", "--version"}).starts_with("v")) GTEST_SKIP() << "node is not installed";
  const std::string judge = R"(
const rules = [];
globalThis.polkit = { addRule: rule => rules.push(rule), Result: { YES: "yes", NOT_HANDLED: null } };
require("vm").runInThisContext(require("fs").readFileSync(process.argv[1], "utf8"));
const say = (user, id) => rules.map(rule => String(rule({ id }, { user }))).join();
const modem = "org.freedesktop.ModemManager1.";
for (const action of ["Device.Control", "Location", "Firmware", "Control", "Messaging", "Device"])
  console.log(action, say("lirra", modem + action), say("mallory", modem + action));
console.log("other", say("lirra", "org.freedesktop.NetworkManager.Control"));
)";
  EXPECT_EQ(
      outputOf({"node", "-e", judge,
                root.path() + ZAL_INSTALL_PREFIX "/share/polkit-1/rules.d/60-com.vendel.lirra.rules"}),
      "Device.Control yes null\nLocation yes null\nFirmware yes null\nControl yes null\nMessaging null null\n"
      "Device null null\nother null");
}

}  // namespace
}  // namespace zal::testing
