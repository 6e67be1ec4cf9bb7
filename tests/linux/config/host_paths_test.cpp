#include "platform/linux/config/host_paths.h"

#include <unistd.h>

#include <cstdlib>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using testing::TemporaryDirectory;
using testing::writeFile;

HostEnvironment user() { return {{}, 1000, "/home/ann"}; }
HostEnvironment system() { return {{}, 0, "/root"}; }

TEST(HostPathsTest, TheSocketIsWhereTheVariableSays) {
  auto environment = system();
  environment.variables["LIRRA_SOCKET"] = "here.sock";
  environment.variables["XDG_RUNTIME_DIR"] = "/run/user/0";
  EXPECT_EQ(socketPath(environment), "here.sock");
}

TEST(HostPathsTest, TheSocketIsNextInTheRuntimeDirectoryAndThenTheSystems) {
  auto environment = system();
  environment.variables["LIRRA_SOCKET"] = "";
  EXPECT_EQ(socketPath(environment), "/run/com.vendel.lirra");
  environment.variables["XDG_RUNTIME_DIR"] = "/run/user/0";
  EXPECT_EQ(socketPath(environment), "/run/user/0/com.vendel.lirra");
}

TEST(HostPathsTest, AUserWithoutRuntimeDirectoryHasNoSocket) { EXPECT_EQ(socketPath(user()), std::nullopt); }

TEST(HostPathsTest, TheConfigurationIsLookedForInTheUsersDirectoryBeforeTheSystems) {
  auto environment = user();
  EXPECT_THAT(configurationFileCandidates(environment),
              ElementsAre("/home/ann/.config/lirra/lirra.toml", "/etc/lirra/lirra.toml"));
  environment.variables["XDG_CONFIG_HOME"] = "/conf/";
  EXPECT_THAT(configurationFileCandidates(environment),
              ElementsAre("/conf/lirra/lirra.toml", "/etc/lirra/lirra.toml"));
  environment.variables["LIRRA_CONFIG"] = "/my/own.toml";
  EXPECT_THAT(configurationFileCandidates(environment), ElementsAre("/my/own.toml"));
}

TEST(HostPathsTest, ARelativeBaseDirectoryIsIgnored) {
  auto environment = user();
  environment.variables["XDG_CONFIG_HOME"] = "conf";
  EXPECT_EQ(configurationFileCandidates(environment).front(), "/home/ann/.config/lirra/lirra.toml");
}

TEST(HostPathsTest, PreferencesLieBesideTheConfiguration) {
  const TemporaryDirectory directory;
  auto environment = user();
  environment.variables["XDG_CONFIG_HOME"] = directory.path();
  EXPECT_EQ(preferenceDirectory(environment), directory / "lirra");
  writeFile(directory / "lirra/lirra.toml", "");
  EXPECT_EQ(preferenceDirectory(environment), directory / "lirra");
  environment.variables["LIRRA_CONFIG"] = "/my/own.toml";
  EXPECT_EQ(preferenceDirectory(environment), "/my");
  environment.variables["LIRRA_CONFIG"] = "/own.toml";
  EXPECT_EQ(preferenceDirectory(environment), "/");
  environment.variables["LIRRA_CONFIG"] = "own.toml";
  EXPECT_EQ(preferenceDirectory(environment), ".");
}

TEST(HostPathsTest, ASystemAgentWithoutConfigurationHasItsPreferencesInTheSystemsDirectory) {
  const TemporaryDirectory directory;
  auto environment = system();
  environment.variables["XDG_CONFIG_HOME"] = directory.path();
  EXPECT_EQ(preferenceDirectory(environment), "/etc/lirra");
}

std::string table(DirectoryRoots roots) {
  fillDependentRoots(roots);
  return roots.UserLogRoot + '\n' + roots.MobileLogRoot + '\n' + roots.DiagnosticReportRoot + '\n' +
         roots.WirelessLogRoot + '\n' + roots.WirelessReportRoot + '\n' + roots.RootReportRoot + '\n' +
         roots.SystemLogRoot + '\n' + roots.SystemReportRoot + '\n' + roots.NetworkConfigRoot + '\n' +
         roots.MediaLogCacheDir + '\n' + roots.LocationCacheDir + '\n' + roots.TemporaryRoot + '\n' +
         roots.UartLogFile + '\n' + roots.VarLogRoot + '\n' + roots.RuntimeRoot + '\n' +
         roots.StateRoot + '\n';
}

TEST(HostPathsTest, AUsersRootsLieBelowTheStateDirectory) {
  EXPECT_EQ(table(defaultDirectoryRoots(user())), R"(/home/ann/.local/state/lirra/Logs
/home/ann/.local/state/lirra/Logs
/home/ann/.local/state/lirra/Logs/DiagnosticReports
/home/ann/.local/state/lirra/Wireless/Logs
/home/ann/.local/state/lirra/Wireless/Logs/DiagnosticReports
/home/ann/.local/state/lirra/Root/DiagnosticReports
/home/ann/.local/state/lirra/System/Logs
/home/ann/.local/state/lirra/System/Logs/DiagnosticReports
/home/ann/.local/state/lirra/NetworkConfiguration
/home/ann/.cache/lirra/Media
/home/ann/.cache/lirra/Location
/tmp
/dev/uart.log
/var/log
/home/ann/.local/state/lirra/run
/home/ann/.local/state/lirra
)");
}

TEST(HostPathsTest, TheStateCacheAndRuntimeVariablesMoveAUsersRoots) {
  auto environment = user();
  environment.variables["XDG_STATE_HOME"] = "/state";
  environment.variables["XDG_RUNTIME_DIR"] = "/run/user/1000";
  environment.variables["XDG_CACHE_HOME"] = "/cache";
  const auto roots = defaultDirectoryRoots(environment);
  EXPECT_EQ(roots.UserLogRoot, "/state/lirra/Logs");
  EXPECT_EQ(roots.MediaLogCacheDir, "/cache/lirra/Media");
  EXPECT_EQ(roots.RuntimeRoot, "/run/user/1000/lirra");
}

TEST(HostPathsTest, ASystemAgentUsesTheSystemsDirectories) {
  EXPECT_EQ(table(defaultDirectoryRoots(system())), R"(/var/log/lirra
/var/log/lirra
/var/log/lirra/DiagnosticReports
/var/lib/lirra/Wireless/Logs
/var/lib/lirra/Wireless/Logs/DiagnosticReports
/var/crash
/var/log
/var/log/DiagnosticReports
/etc/network
/var/cache/lirra/Media
/var/cache/lirra/Location
/tmp
/dev/uart.log
/var/log
/run/lirra
/var/lib/lirra
)");
}

TEST(HostEnvironmentTest, ReadsThisProcess) {
  ::setenv("ZAL_ENVIRONMENT_TEST", "a=b", 1);
  const auto environment = HostEnvironment::ofThisProcess();
  EXPECT_EQ(environment.variable("ZAL_ENVIRONMENT_TEST"), "a=b");
  EXPECT_EQ(environment.variable("ZAL_ENVIRONMENT_TEST_NOT_SET"), "");
  EXPECT_EQ(environment.userId, ::geteuid());
  EXPECT_TRUE(environment.homeDirectory.starts_with('/'));
  EXPECT_TRUE(std::filesystem::exists(environment.executableDirectory + "/linux_config_tests"));
  ::unsetenv("ZAL_ENVIRONMENT_TEST");
}

}  // namespace
}  // namespace zal
