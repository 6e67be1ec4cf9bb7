#include "platform/linux/config/configuration_loader.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <set>

#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using testing::TemporaryDirectory;
using testing::writeFile;

class ConfigurationLoaderTest : public ::testing::Test {
 protected:
  ConfigurationLoaderTest() {
    environment.userId = 1000;
    environment.homeDirectory = "/home/ann";
    environment.variables["LIRRA_CONFIG"] = file;
  }
  LoadedConfiguration load() const { return ConfigurationLoader(environment).load(); }
  LoadedConfiguration load(const std::string& text) const {
    writeFile(file, text);
    return load();
  }

  TemporaryDirectory directory;
  const std::string file = directory / "lirra.toml";
  HostEnvironment environment;
};

TEST_F(ConfigurationLoaderTest, AnEmptyFileLeavesTheDefaults) {
  const auto loaded = load("");
  EXPECT_THAT(loaded.warnings, IsEmpty());
  EXPECT_EQ(loaded.file, file);
  EXPECT_EQ(loaded.configuration.log.rotationSize, 4'194'304U);
  EXPECT_EQ(loaded.configuration.log.maximumOpenFiles, 64U);
  EXPECT_EQ(loaded.configuration.ipc.maximumPayload, 16'777'216U);
  EXPECT_EQ(loaded.configuration.ipc.maximumReplyBacklog, 1'048'576U);
  EXPECT_EQ(loaded.configuration.disk.size, 0U);
  EXPECT_EQ(loaded.configuration.disk.share, 10U);
  EXPECT_EQ(loaded.configuration.disk.keepFree, 15U);
  EXPECT_EQ(loaded.configuration.inactivityLimit, std::nullopt);
  EXPECT_EQ(loaded.configuration.roots.UserLogRoot, "/home/ann/.local/state/lirra/Logs");
}

TEST_F(ConfigurationLoaderTest, WithoutAnyFileTheDefaultsStandAndNothingIsSaid) {
  environment.variables.clear();
  environment.variables["XDG_CONFIG_HOME"] = directory / "config";
  const auto loaded = load();
  EXPECT_THAT(loaded.warnings, IsEmpty());
  EXPECT_EQ(loaded.file, "");
  EXPECT_EQ(loaded.configuration.roots.TemporaryRoot, "/tmp");
}

TEST_F(ConfigurationLoaderTest, FindsTheFileInTheUsersConfigurationDirectory) {
  environment.variables.clear();
  environment.variables["XDG_CONFIG_HOME"] = directory / "config";
  writeFile(directory / "config/lirra/lirra.toml", "[ipc]\ngroup = \"calls\"\n");
  const auto loaded = load();
  EXPECT_EQ(loaded.file, directory / "config/lirra/lirra.toml");
  EXPECT_EQ(loaded.configuration.ipc.group, "calls");
}

TEST_F(ConfigurationLoaderTest, EveryKeyReachesItsField) {
  const auto loaded = load(R"(
[roots]
UserLogRoot = "/r/user"
MobileLogRoot = "/r/mobile"
DiagnosticReportRoot = "/r/reports"
WirelessLogRoot = "/r/wireless"
WirelessReportRoot = "/r/wirelessreports"
RootReportRoot = "/r/root"
SystemLogRoot = "/r/system"
SystemReportRoot = "/r/systemreports"
NetworkConfigRoot = "/r/network"
MediaLogCacheDir = "/r/media"
LocationCacheDir = "/r/location"
TemporaryRoot = "/r/tmp"
UartLogFile = "/r/uart.log"
VarLogRoot = "/r/varlog"
RuntimeRoot = "/r/run"
StateRoot = "/r/state"
[endpoints]
reportHost = "report.example"
cellPingServer = "192.0.2.1"
wifiPingServer = "192.0.2.2"
makerWebHost = "www.maker.example"
searchWebHost = "search_1.example"
farsite = "192.0.2.3"
pushCourierHost1 = "1-courier.push.example"
pushCourierHost2 = "192.0.2.4"
pushCourierHost6 = "2001:db8::6"
[interfaces]
wifi = "wlp3s0"
cellular = "wwp0"
[ipc]
group = "calls"
maximumPayload = 2048
maximumReplyBacklog = 4096
[bus]
enabled = false
[blackbox]
enabled = false
sync = true
[memory]
session = 65536
peer = 131072
total = 262144
[disk]
size = 1099511627776
share = 20
keepFree = 0
[watchdog]
limit = 40
[log]
categories = ["IPC", "Ping"]
rotationSize = 1024
maximumOpenFiles = 2
journal = false
journalSocket = "/r/journal"
[commands]
profile = "literal"
systemLogReader = "log-reader_1.0+"
toolDirectory = "~/tools/"
"network.console.lsof" = "lsof -n"
plain = ""
[collection]
cloudSyncLog = "Cloud Sync.log"
pairedDeviceLog1 = "/r/paired1"
pairedDeviceLog2 = "/r/paired2"
pairedDeviceDirectory = "~/paired"
pushLogDirectory = "/r/push/"
[archive]
compression = "small"
[device]
SystemVersionFile = "/r/version.plist"
internalInstall = true
videoCallsOverCellular = false
[testing]
inactivityLimit = 1.5
closingStageDelay = 0.25
delayedEnd = 0.5
)");
  EXPECT_THAT(loaded.warnings, IsEmpty());
  const auto& c = loaded.configuration;
  EXPECT_EQ(c.roots.UserLogRoot, "/r/user");
  EXPECT_EQ(c.roots.MobileLogRoot, "/r/mobile");
  EXPECT_EQ(c.roots.DiagnosticReportRoot, "/r/reports");
  EXPECT_EQ(c.roots.WirelessLogRoot, "/r/wireless");
  EXPECT_EQ(c.roots.WirelessReportRoot, "/r/wirelessreports");
  EXPECT_EQ(c.roots.RootReportRoot, "/r/root");
  EXPECT_EQ(c.roots.SystemLogRoot, "/r/system");
  EXPECT_EQ(c.roots.SystemReportRoot, "/r/systemreports");
  EXPECT_EQ(c.roots.NetworkConfigRoot, "/r/network");
  EXPECT_EQ(c.roots.MediaLogCacheDir, "/r/media");
  EXPECT_EQ(c.roots.LocationCacheDir, "/r/location");
  EXPECT_EQ(c.roots.TemporaryRoot, "/r/tmp");
  EXPECT_EQ(c.roots.UartLogFile, "/r/uart.log");
  EXPECT_EQ(c.roots.VarLogRoot, "/r/varlog");
  EXPECT_EQ(c.roots.RuntimeRoot, "/r/run");
  EXPECT_EQ(c.roots.StateRoot, "/r/state");
  EXPECT_EQ(c.endpoints.reportServer, "report.example");
  EXPECT_EQ(c.endpoints.cellPingServer, "192.0.2.1");
  EXPECT_EQ(c.endpoints.wifiPingServer, "192.0.2.2");
  EXPECT_EQ(c.endpoints.makerWebHost, "www.maker.example");
  EXPECT_EQ(c.endpoints.searchWebHost, "search_1.example");
  EXPECT_EQ(c.endpoints.farsite, "192.0.2.3");
  EXPECT_EQ(c.endpoints.pushCourierHost1, "1-courier.push.example");
  EXPECT_EQ(c.endpoints.pushCourierHost2, "192.0.2.4");
  EXPECT_EQ(c.endpoints.pushCourierHost6, "2001:db8::6");
  EXPECT_EQ(c.interfaces.wifi, "wlp3s0");
  EXPECT_EQ(c.interfaces.cellular, "wwp0");
  EXPECT_EQ(c.ipc.group, "calls");
  EXPECT_EQ(c.ipc.maximumPayload, 2048U);
  EXPECT_EQ(c.ipc.maximumReplyBacklog, 4096U);
  EXPECT_FALSE(c.bus.enabled);
  EXPECT_FALSE(c.blackBox.enabled);
  EXPECT_TRUE(c.blackBox.sync);
  EXPECT_EQ(c.memory.session, 65536U);
  EXPECT_EQ(c.memory.peer, 131072U);
  EXPECT_EQ(c.memory.total, 262144U);
  EXPECT_EQ(c.disk.size, 1'099'511'627'776U);
  EXPECT_EQ(c.disk.share, 20U);
  EXPECT_EQ(c.disk.keepFree, 0U);
  EXPECT_EQ(c.watchdog.limit, 40U);
  EXPECT_THAT(c.log.categories, ElementsAre("IPC", "Ping"));
  EXPECT_EQ(c.log.rotationSize, 1024U);
  EXPECT_EQ(c.log.maximumOpenFiles, 2U);
  EXPECT_FALSE(c.log.journal);
  EXPECT_EQ(c.log.journalSocket, "/r/journal");
  EXPECT_EQ(c.commands.profile, CommandProfile::literal);
  EXPECT_EQ(c.commands.systemLogReader, "log-reader_1.0+");
  EXPECT_EQ(c.commands.toolDirectory, "/home/ann/tools");
  EXPECT_EQ(c.commands.rows,
            (std::map<std::string, std::string>{{"network.console.lsof", "lsof -n"}, {"plain", ""}}));
  EXPECT_EQ(c.collection.cloudSyncLog, "Cloud Sync.log");
  EXPECT_EQ(c.collection.pairedDeviceLog1, "/r/paired1");
  EXPECT_EQ(c.collection.pairedDeviceLog2, "/r/paired2");
  EXPECT_EQ(c.collection.pairedDeviceDirectory, "/home/ann/paired");
  EXPECT_EQ(c.collection.pushLogDirectory, "/r/push");
  EXPECT_EQ(c.archiveCompression, ArchiveCompression::small);
  EXPECT_TRUE(c.internalInstall);
  EXPECT_EQ(c.videoCallsOverCellular, false);
  EXPECT_EQ(c.systemVersionFile, "/r/version.plist");
  EXPECT_EQ(c.inactivityLimit, std::chrono::milliseconds{1500});
  EXPECT_EQ(c.closingStageDelay, std::chrono::milliseconds{250});
  EXPECT_EQ(c.delayedEnd, std::chrono::milliseconds{500});
}

TEST_F(ConfigurationLoaderTest, WithoutAWordTheAgentTalksToNobodyAndRunsWhatLinuxHas) {
  environment.executableDirectory = "/usr/libexec/lirra";
  const auto c = load("").configuration;
  for (const std::string& host :
       {c.endpoints.makerWebHost, c.endpoints.searchWebHost, c.endpoints.farsite,
        c.endpoints.pushCourierHost1, c.endpoints.pushCourierHost2, c.endpoints.pushCourierHost6}) {
    EXPECT_EQ(host, "");
  }
  EXPECT_EQ(c.commands.profile, CommandProfile::linux);
  EXPECT_EQ(c.commands.systemLogReader, "tessel");
  EXPECT_EQ(c.commands.toolDirectory, "/usr/libexec/lirra");
  EXPECT_THAT(c.commands.rows, IsEmpty());
  EXPECT_EQ(c.collection.cloudSyncLog, "");
  EXPECT_EQ(c.archiveCompression, Configuration().archiveCompression);
  EXPECT_FALSE(c.internalInstall);
  EXPECT_EQ(c.videoCallsOverCellular, std::nullopt);
}

TEST_F(ConfigurationLoaderTest, TextsThatCommandLinesTakeMayBeNothingButNames) {
  const auto loaded = load(R"toml([endpoints]
makerWebHost = "www.example; touch X"
searchWebHost = "-n"
farsite = "::1"
pushCourierHost1 = "$(id)"
pushCourierHost2 = 4
[commands]
systemLogReader = "a-name-of-16-byt"
)toml");
  EXPECT_THAT(loaded.warnings,
              ElementsAre(file + ":2: endpoints.makerWebHost wants a host name or an address",
                          file + ":3: endpoints.searchWebHost wants a host name or an address",
                          file + ":4: endpoints.farsite wants an IPv4 address",
                          file + ":5: endpoints.pushCourierHost1 wants a host name or an address",
                          file + ":6: endpoints.pushCourierHost2 wants a text in quotes",
                          file + ":8: commands.systemLogReader wants a program's name of 1 to 15 letters, "
                                 "digits and . _ + -"));
  EXPECT_EQ(loaded.configuration.commands.systemLogReader, "tessel");
  EXPECT_EQ(loaded.configuration.endpoints.makerWebHost, "");
}

TEST_F(ConfigurationLoaderTest, TheLogReadersNameIsWhatTheKernelShows) {
  const auto reader = [this](const std::string& name) {
    return load("[commands]\nsystemLogReader = '" + name + "'\n").configuration.commands.systemLogReader;
  };
  EXPECT_EQ(reader("fifteen-bytes-1"), "fifteen-bytes-1");
  for (const char* const name : {"", "sixteen-bytes-12", "/usr/bin/reader", "a b", "-9", ".x", "a'b"}) {
    EXPECT_EQ(reader(name), "tessel") << name;
  }
}

TEST_F(ConfigurationLoaderTest, AHostMayBeTakenBackToNone) {
  const auto loaded = load("[endpoints]\nfarsite = \"\"\nmakerWebHost = \"\"\n");
  EXPECT_THAT(loaded.warnings, IsEmpty());
}

TEST_F(ConfigurationLoaderTest, WrongWordsOfTheDumpsSectionsAreNamed) {
  const auto loaded = load(R"([commands]
profile = "bsd"
toolDirectory = "tools"
network.console = "x"
"network.power" = 3
[collection]
cloudSyncLog = "../x"
pairedDeviceLog1 = "x"
surprise = "x"
[archive]
compression = "tiny"
[device]
internalInstall = "yes"
videoCallsOverCellular = 1
)");
  EXPECT_THAT(loaded.warnings,
              ElementsAre(file + ":2: commands.profile wants \"linux\" or \"literal\"",
                          file + ":3: commands.toolDirectory must be an absolute path, not \"tools\"",
                          file + ":4: commands.network wants its dots inside quotes: \"network...\"",
                          file + ":5: commands.network.power wants a text in quotes",
                          file + ":7: collection.cloudSyncLog wants a plain file name",
                          file + ":8: collection.pairedDeviceLog1 must be an absolute path, not \"x\"",
                          file + ":9: unknown key collection.surprise",
                          file + ":11: archive.compression wants \"small\" or \"fast\"",
                          file + ":13: device.internalInstall wants true or false",
                          file + ":14: device.videoCallsOverCellular wants true or false"));
  EXPECT_THAT(loaded.configuration.commands.rows, IsEmpty());
}

TEST_F(ConfigurationLoaderTest, UnknownKeysAndWrongTypesAreNamedByLineAndTheOthersStand) {
  const auto loaded = load(R"([roots]
UserLogRoot = "relative/logs"
SystemLogRoot = ""
NetworkConfigRoot = 7
Surprise = "/x"

[log]
rotationSize = "big"
maximumOpenFiles = 0
categories = ["IPC", 3]

[ipc]
maximumPayload = 2147483648
group = "calls"

[colours]
red = true
)");
  EXPECT_THAT(loaded.warnings,
              ElementsAre(file + ":2: roots.UserLogRoot must be an absolute path, not \"relative/logs\"",
                          file + ":3: roots.SystemLogRoot is empty, but must be an absolute path",
                          file + ":4: roots.NetworkConfigRoot wants a path in quotes",
                          file + ":5: unknown key roots.Surprise",
                          file + ":8: log.rotationSize wants a whole number from 1024 to 1073741824",
                          file + ":9: log.maximumOpenFiles wants a whole number from 1 to 65536",
                          file + ":10: log.categories wants a list of texts in quotes",
                          file + ":13: ipc.maximumPayload wants a whole number from 1024 to 1073741824",
                          file + ":16: unknown section [colours]"));
  EXPECT_EQ(loaded.configuration.ipc.group, "calls");
  EXPECT_EQ(loaded.configuration.roots.UserLogRoot, "/home/ann/.local/state/lirra/Logs");
  EXPECT_EQ(loaded.configuration.log.rotationSize, 4'194'304U);
  EXPECT_THAT(loaded.configuration.log.categories, IsEmpty());
}

TEST_F(ConfigurationLoaderTest, PercentagesOfTheDiskBeyondTheWholeAreRefused) {
  const auto loaded = load("[disk]\nshare = 101\nkeepFree = -1\nsize = \"1 GiB\"\n");
  EXPECT_THAT(loaded.warnings,
              ElementsAre(file + ":2: disk.share wants a whole number from 0 to 100",
                          file + ":3: disk.keepFree wants a whole number from 0 to 100",
                          file + ":4: disk.size wants a whole number from 0 to 1125899906842624"));
  EXPECT_EQ(loaded.configuration.disk.share, 10U);
}

TEST_F(ConfigurationLoaderTest, AKeyOutsideAnySectionAndASectionThatIsNoneAreNamed) {
  const auto loaded = load("rotationSize = 4\nlog = 5\n");
  EXPECT_THAT(loaded.warnings,
              ElementsAre(file + ":1: unknown key rotationSize", file + ":2: log must be a section"));
}

TEST_F(ConfigurationLoaderTest, ABrokenFileLeavesTheDefaultsAndNamesTheLine) {
  const auto loaded = load("[ipc]\ngroup = \"calls\"\n[log\n");
  ASSERT_EQ(loaded.warnings.size(), 1U);
  EXPECT_TRUE(loaded.warnings[0].starts_with(file + ":3: ")) << loaded.warnings[0];
  EXPECT_EQ(loaded.configuration.ipc.group, "");
  EXPECT_EQ(loaded.configuration.roots.UserLogRoot, "/home/ann/.local/state/lirra/Logs");
}

TEST_F(ConfigurationLoaderTest, AMissingNamedFileIsSaid) {
  EXPECT_THAT(load().warnings, ElementsAre(file + ":1: cannot be read: No such file or directory"));
}

TEST_F(ConfigurationLoaderTest, ADirectoryInThePlaceOfTheFileIsSaid) {
  std::filesystem::create_directory(file);
  EXPECT_THAT(load().warnings, ElementsAre(file + ":1: cannot be read: Is a directory"));
}

TEST_F(ConfigurationLoaderTest, AnEndlessFileIsNotReadToItsEnd) {
  const auto loaded = load("# " + std::string(1U << 20U, 'x'));
  EXPECT_THAT(loaded.warnings, ElementsAre(file + ":1: cannot be read: File too large"));
}

TEST_F(ConfigurationLoaderTest, RootsThatFollowAnotherRootMoveWithIt) {
  const auto roots = load("[roots]\nUserLogRoot = \"/logs\"\nSystemLogRoot = \"/sys\"\n").configuration.roots;
  EXPECT_EQ(roots.MobileLogRoot, "/logs");
  EXPECT_EQ(roots.DiagnosticReportRoot, "/logs/DiagnosticReports");
  EXPECT_EQ(roots.SystemReportRoot, "/sys/DiagnosticReports");
}

TEST_F(ConfigurationLoaderTest, AHomeMarkIsExpandedAndTrailingSlashesGo) {
  const auto roots = load("[roots]\nUserLogRoot = \"~/logs//\"\nVarLogRoot = \"~\"\n").configuration.roots;
  EXPECT_EQ(roots.UserLogRoot, "/home/ann/logs");
  EXPECT_EQ(roots.VarLogRoot, "/home/ann");
}

TEST_F(ConfigurationLoaderTest, CategoriesOfTheEnvironmentAreAddedOnce) {
  environment.variables["LIRRA_LOG_CATEGORIES"] = "IPC, Ping,,Logging ,Ping";
  EXPECT_THAT(load("[log]\ncategories = [\"IPC\"]\n").configuration.log.categories,
              ElementsAre("IPC", "Ping", "Logging"));
}

TEST_F(ConfigurationLoaderTest, TheInactivityLimitMayBeAWholeNumberOfSeconds) {
  EXPECT_EQ(load("[testing]\ninactivityLimit = 2\n").configuration.inactivityLimit,
            std::chrono::milliseconds{2000});
}

TEST_F(ConfigurationLoaderTest, AnInactivityLimitOfNothingIsRefused) {
  for (const char* value : {"0", "-1.0", "nan", "inf", "\"6\"", "true"}) {
    const auto loaded = load(std::string("[testing]\ninactivityLimit = ") + value + "\n");
    EXPECT_THAT(
        loaded.warnings,
        ElementsAre(file + ":2: testing.inactivityLimit wants a number of seconds from 0.001 to 31536000"))
        << value;
    EXPECT_EQ(loaded.configuration.inactivityLimit, std::nullopt);
  }
}

/// The keys that a row of a table in the document begins with.
std::set<std::string> documentedKeys() {
  const auto document = std::filesystem::path(__FILE__).parent_path() / "../../../docs/configuration.md";
  std::ifstream text(document);
  std::set<std::string> keys;
  for (std::string line; std::getline(text, line);) {
    if (!line.starts_with("| `")) continue;
    const std::string key = line.substr(3, line.find('`', 3) - 3);
    if (key.find('.') != std::string::npos) keys.insert(key);
  }
  return keys;
}

TEST(ConfigurationDocumentTest, ListsExactlyTheKeysThatTheLoaderKnows) {
  const auto known = ConfigurationLoader::knownKeys();
  EXPECT_EQ(documentedKeys(), std::set<std::string>(known.begin(), known.end()));
}

}  // namespace
}  // namespace zal
