#include "dump/service_collection.h"

#include <sys/stat.h>

#include <stdexcept>

#include "dump/disk_budget_keeper.h"
#include "dump/planned_steps.h"
#include "tests/dump/collection_fixture.h"
#include "tests/dump/prepared_host.h"

namespace zal {
namespace {

using testing::listTree;
namespace fs = std::filesystem;
using Lines = std::vector<std::string>;
using namespace std::chrono_literals;

constexpr CollectionFlags kEveryStep = 0x3F8FF;

class ServiceCollectionTest : public testing::CollectionFixture {
 protected:
  ServiceCollectionTest() { host.fileCopier.holdsBack = true; }

  [[nodiscard]] CollectionRequest request(const std::string& service, CollectionFlags flags) const {
    return {.service = service,
            .destination = host.home / "dump",
            .reason = {},
            .background = false,
            .flags = flags};
  }
  void collect(const std::string& service, CollectionFlags flags) {
    collection.CollectServiceLogs(request(service, flags), [this] { ++completions; });
  }
  void finishArchives() {
    for (const auto& release : host.fileCopier.heldBack) release();
    host.fileCopier.heldBack.clear();
    host.queues.runAll();
  }
  [[nodiscard]] std::string tree() const { return listTree(host.home / "dump"); }

  /// What the calling thread does while it waits for the Wi-Fi diagnostics.
  std::function<void()> duringTheWait = [] {};
  std::vector<std::chrono::seconds> waits;
  ServiceCollection collection{{.platform = host.platform,
                                .collectors = collectors,
                                .closing = closing,
                                .wait = [this](std::binary_semaphore& signal, std::chrono::seconds limit) {
                                  waits.push_back(limit);
                                  duringTheWait();
                                  return signal.try_acquire();
                                }}};
  int completions = 0;

  /// A collection that minds the disk.
  struct Budgeted {
    explicit Budgeted(ServiceCollectionTest& test)
        : disk(test.host.platform),
          stages({.platform = test.host.platform,
                  .collectors = test.collectors,
                  .compressor = test.compressor,
                  .disk = &disk}),
          budgeted({.platform = test.host.platform,
                    .collectors = test.collectors,
                    .closing = stages,
                    .wait = [](std::binary_semaphore& signal,
                               std::chrono::seconds) { return signal.try_acquire(); },
                    .disk = &disk}) {}
    DiskBudgetKeeper disk;
    ClosingStages stages;
    ServiceCollection budgeted;
  };
};

TEST_F(ServiceCollectionTest, FirstLineOfTheLogNamesTheServiceAndTheDirectory) {
  collect("Quillet", 0);
  EXPECT_EQ(host.agentLog.lines.front(),
            "notice: Copying logs for service Quillet into path " + (host.home / "dump"));
}

TEST_F(ServiceCollectionTest, FlagsOfZeroStillMakeThreeDirectoriesAndRunTheClosingStages) {
  put("Logs/LocalPreview/LocalPreview.log");
  collect("Quillet", 0);
  EXPECT_EQ(tree(), "Power/\nPush Logs/\nSnapshots/\n");
  advance(8s);
  EXPECT_EQ(host.fileCopier.started.size(), 1U);
  finishArchives();
  EXPECT_EQ(completions, 1);
}

TEST_F(ServiceCollectionTest, VideoCallsBringTheirLocalPreviewWhateverTheFlags) {
  put("Logs/LocalPreview/LocalPreview.log");
  collect("Vistel", 0);
  EXPECT_EQ(tree(), "LocalPreview/\nLocalPreview/LocalPreview.log\nPower/\nPush Logs/\nSnapshots/\n");
}

TEST_F(ServiceCollectionTest, UsualCollectionTakesPingsRegistrationPushBasebandAndSystemLogsButNoStackshot) {
  prepareHost(host);
  collect("Vistel", 0x5F);
  host.queues.runAll();
  EXPECT_EQ(host.pings.tests.size(), 3U);
  for (const char* directory : {"Registration", "Push Logs", "Baseband Logs", "System Logs", "Network"}) {
    EXPECT_TRUE(exists(std::string("dump/") + directory)) << directory;
  }
  EXPECT_TRUE(host.crashReporter.stackshots.empty());
}

TEST_F(ServiceCollectionTest, WideCollectionAddsTheStackshot) {
  collect("Vistel", 0x7F);
  EXPECT_EQ(host.crashReporter.stackshots, Lines{"ZalLogging Log Dump"});
}

TEST_F(ServiceCollectionTest, PingsWithoutTheNetworkDumpHaveNoEffect) {
  collect("Quillet", 0x40);
  host.queues.runAll();
  EXPECT_TRUE(host.pings.tests.empty());
  EXPECT_EQ(tree(), "Power/\nPush Logs/\nSnapshots/\n");
  EXPECT_EQ(host.shell.commands, (Lines{"/usr/bin/killall -9 tessel", "/usr/bin/killall -9 tessel"}));
}

TEST_F(ServiceCollectionTest, MissingSourcesAreSkippedWithoutAWordAndLeaveTheirEmptyDirectories) {
  collect("Vistel", kEveryStep & ~(kCollectNetwork | kCollectRegistration | kCollectMedia));
  EXPECT_EQ(tree(),
            "Baseband Logs/\nBluetooth/\nKinsight/\nLaunchpath/\nLocalPreview/\nLocation/\nNearwave/\n"
            "Nexa/\nPhone Tandem/\nPhone/\nPower/\nPush Logs/\nSharing/\nSnapshots/\nSystem Logs/\n"
            "TCPDump/\nVistel/\nuart/\n");
}

TEST_F(ServiceCollectionTest, PellitonDirectoryIsMadeByItsFirstLinkOnly) {
  collect("Quillet", kCollectMedia);
  EXPECT_EQ(tree(), "Phone/\nPower/\nPush Logs/\nRadioMarshal/\nSnapshots/\nTCPDump/\n");
}

TEST_F(ServiceCollectionTest, DirectoriesAreOpenToEveryUser) {
  const mode_t umaskBefore = ::umask(077);
  collect("Vistel", kEveryStep);
  ::umask(umaskBefore);
  EXPECT_EQ(fs::status(host.home / "dump").permissions(), fs::perms::all);
  for (const auto& entry : fs::recursive_directory_iterator(host.home / "dump")) {
    if (!entry.is_directory()) continue;
    EXPECT_EQ(entry.status().permissions(), fs::perms::all) << entry.path();
  }
}

TEST_F(ServiceCollectionTest, ClosingStagesRunInsideTheCallUnlessForTheBackground) {
  put("Logs/Reports/Vistel-1.crash");
  collect("Quillet", 0);
  EXPECT_TRUE(exists("dump/System Logs/Vistel-1.crash"));
  EXPECT_EQ(host.queues.readyJobs("global.default"), 0U);
}

TEST_F(ServiceCollectionTest, ClosingStagesForTheBackgroundWaitOnTheStandardQueue) {
  put("Logs/Reports/Vistel-1.crash");
  CollectionRequest background = request("Quillet", 0);
  background.background = true;
  collection.CollectServiceLogs(background, [this] { ++completions; });
  EXPECT_EQ(tree(), "Power/\nPush Logs/\nSnapshots/\n");
  EXPECT_TRUE(host.queues.runNext("global.default"));
  EXPECT_TRUE(exists("dump/System Logs/Vistel-1.crash"));
  advance(8s);
  finishArchives();
  EXPECT_EQ(completions, 1);
}

TEST_F(ServiceCollectionTest, CompletionRunsOnceWhenTheArchiveIsThere) {
  collect("Quillet", 0);
  advance(8s);
  EXPECT_EQ(completions, 0);
  finishArchives();
  EXPECT_EQ(completions, 1);
  EXPECT_TRUE(exists("dump.zip"));
  advance(1h);
  EXPECT_EQ(completions, 1);
}

TEST_F(ServiceCollectionTest, NobodyHasToWaitForTheArchive) {
  collection.CollectServiceLogs(request("Quillet", 0));
  advance(8s);
  finishArchives();
  EXPECT_TRUE(exists("dump.zip"));
}

TEST_F(ServiceCollectionTest, WifiDiagnosticsFillTheSystemsReportDirectoryWithTheReason) {
  CollectionRequest withReason = request("Quillet", kCollectMedia);
  withReason.reason = "it fell silent";
  collection.CollectServiceLogs(withReason);
  collect("Quillet", kCollectMedia);
  const std::string directory = fs::canonical(host.home.path()).string() + "/System/Reports/WiFi";
  using Taken = testing::FakeWifiDiagnostics::Taken;
  EXPECT_EQ(
      host.wifiDiagnostics.taken,
      (std::vector<Taken>{{directory, "it fell silent"}, {directory, "WiFi log dump for service: Quillet"}}));
  EXPECT_EQ(fs::status(directory).permissions(), fs::perms::all);
}

TEST_F(ServiceCollectionTest, WifiDiagnosticsThatAnswerAtOnceLeaveTheirResultInTheLog) {
  host.wifiDiagnostics.result = 42;
  collect("Quillet", kCollectMedia);
  EXPECT_EQ(linesWith("wifi"), Lines{});
  EXPECT_EQ(linesWith("Wifi"), Lines{"warning: Wifi dump log result: 42"});
  EXPECT_EQ(host.dumpProgress.lines.at(3), "MISSING Wi-Fi diagnostics: the service answered 42");
}

TEST_F(ServiceCollectionTest, CallerWaitsFifteenSecondsForWifiDiagnosticsAndGoesOn) {
  host.wifiDiagnostics.holdsBack = true;
  put("System/Reports/setkey.log");
  collect("Vistel", kCollectMedia);
  EXPECT_EQ(waits, std::vector<std::chrono::seconds>{15s});
  EXPECT_EQ(linesWith("wifi"), Lines{"warning: Timed out while waiting for wifi logs dump to complete"});
  EXPECT_EQ(host.dumpProgress.lines.at(3), "MISSING Wi-Fi diagnostics: not complete in time");
  EXPECT_TRUE(exists("dump/setkey.log"));
  host.wifiDiagnostics.heldBack.at(0)(0);
  EXPECT_EQ(linesWith("Wifi"), Lines{"warning: Wifi dump log result: 0"});
  advance(8s);
  finishArchives();
  EXPECT_EQ(completions, 1);
}

TEST_F(ServiceCollectionTest, AnswerDuringTheWaitEndsIt) {
  host.wifiDiagnostics.holdsBack = true;
  duringTheWait = [this] { host.wifiDiagnostics.heldBack.at(0)(0); };
  collect("Vistel", kCollectMedia);
  EXPECT_EQ(linesWith("wifi"), Lines{});
  EXPECT_EQ(linesWith("Wifi"), Lines{"warning: Wifi dump log result: 0"});
}

TEST_F(ServiceCollectionTest, WaitEndsWithTheSignalOrWithItsTime) {
  std::binary_semaphore signal{0};
  EXPECT_FALSE(waitInSteadyTime(signal, 0s));
  signal.release();
  EXPECT_TRUE(waitInSteadyTime(signal, 3600s));
}

TEST_F(ServiceCollectionTest, StartTimeIsTakenOnceBeforeAnythingIsWaitedFor) {
  host.wifiDiagnostics.holdsBack = true;
  duringTheWait = [this] { host.host.advance(15s); };
  put("Wireless/Reports/SystemLog-2024-05-02-140306.log");
  put("Wireless/Reports/SystemLog-2024-05-02-140307.log");
  collect("Quillet", kCollectMedia | kCollectSystemLogs);
  EXPECT_FALSE(exists("dump/System Logs/SystemLog-2024-05-02-140306.log"));
  EXPECT_TRUE(exists("dump/System Logs/SystemLog-2024-05-02-140307.log"));
}

TEST_F(ServiceCollectionTest, RadioCoexistenceIsLookedUpOnceAndDumpedEachTime) {
  host.radioCoexistence.present = true;
  collect("Quillet", 0);
  EXPECT_EQ(host.radioCoexistence.lookUps, 0);
  collect("Quillet", kCollectMedia);
  collect("Quillet", kCollectMedia);
  EXPECT_EQ(host.radioCoexistence.lookUps, 1);
  EXPECT_EQ(host.radioCoexistence.dumps, 2);
}

TEST_F(ServiceCollectionTest, RadioCoexistenceThatIsNotThereIsNotLookedForAgain) {
  collect("Quillet", kCollectMedia);
  host.radioCoexistence.present = true;
  collect("Quillet", kCollectMedia);
  EXPECT_EQ(host.radioCoexistence.lookUps, 1);
  EXPECT_EQ(host.radioCoexistence.dumps, 0);
}

TEST_F(ServiceCollectionTest, WhatTheCoexistenceManagerWritesIsTaken) {
  host.radioCoexistence.present = true;
  host.radioCoexistence.whenDumped = [this] { put("Logs/Reports/RadioMarshal-now.txt"); };
  collect("Quillet", kCollectMedia);
  EXPECT_TRUE(exists("dump/RadioMarshal/RadioMarshal-now.txt"));
}

TEST_F(ServiceCollectionTest, CloudSyncWithoutAConfiguredLogMakesTheDestinationAndLinksNothing) {
  put("Logs/Reports/DiagnosticLogs/other.log");
  collect("Quillet", kCollectCloudSync);
  EXPECT_EQ(tree(), "Power/\nPush Logs/\nSnapshots/\n");
}

TEST_F(ServiceCollectionTest, RegistrationWithoutConfiguredPairedDevicesTakesTheRest) {
  put("System/Logs/tetherd.log");
  collect("Quillet", kCollectRegistration);
  EXPECT_EQ(tree(), "Power/\nPush Logs/\nRegistration/\nRegistration/tetherd.log\nSnapshots/\n");
}

TEST_F(ServiceCollectionTest, LocationEntryThatCannotBeCopiedIsPassedOver) {
  put("LocationCache/a.db");
  put("LocationCache/b.db");
  put("LocationCache/c.db");
  host.files.failWith = [](const std::string& source) {
    return source.ends_with("b.db") ? std::make_error_code(std::errc::permission_denied) : std::error_code{};
  };
  collect("Quillet", kCollectLocation);
  EXPECT_EQ(tree(), "Location/\nLocation/a.db\nLocation/c.db\nPower/\nPush Logs/\nSnapshots/\n");
  EXPECT_EQ(linesWith("b.db"), Lines{});
}

TEST_F(ServiceCollectionTest, RootsMayBeginWithTheHomeMark) {
  host.configuration.roots.LocationCacheDir = "~/LocationCache";
  host.configuration.roots.SystemReportRoot = "~/System/Reports";
  put("LocationCache/a.db");
  put("System/Reports/setkey.log");
  collect("Quillet", kCollectLocation | kCollectMedia);
  EXPECT_TRUE(exists("dump/Location/a.db"));
  EXPECT_TRUE(exists("dump/setkey.log"));
  EXPECT_TRUE(exists("System/Reports/WiFi"));
}

TEST_F(ServiceCollectionTest, EverythingThatExistsAlreadyStaysAsItIs) {
  testing::writeFile(host.home / "dump/Location/a.db", "mine");
  testing::writeFile(host.home / "dump/Power", "a file in the way");
  put("LocationCache/a.db");
  put("tmp/vistel_thermal_log.txt");
  collect("Quillet", kCollectLocation);
  EXPECT_EQ(testing::readFile(host.home / "dump/Location/a.db"), "mine");
  EXPECT_EQ(testing::readFile(host.home / "dump/Power"), "a file in the way");
}

TEST_F(ServiceCollectionTest, PlanOfEverythingNamesEachStepInTheOrderOfTheRun) {
  const Lines names{"Media and radio logs",
                    "Wi-Fi diagnostics",
                    "Location",
                    "Cloud sync",
                    "Video-call logs",
                    "Proximity and Bluetooth",
                    "Hand-over and sharing",
                    "Identity services",
                    "Activity prediction",
                    "Network dump",
                    "Registration and identity",
                    "Local preview",
                    "Push logs",
                    "Network stack logs",
                    "Thermal log",
                    "Stackshot",
                    "Baseband snapshot",
                    "System logs",
                    "Crash logs",
                    "Waiting for slow writers",
                    "Baseband logs",
                    "Snapshots",
                    "Packet captures",
                    "Archive"};
  EXPECT_EQ(wantedNames(ServiceCollection::plan(request("Vistel", kEveryStep))), names);
  prepareHost(host);
  collect("Vistel", kEveryStep);
  advance(8s);
  finishArchives();
  Lines expected{"BEGIN Vistel " + (host.home / "dump")};
  for (std::size_t i = 0; i < names.size(); ++i) {
    expected.push_back("STEP " + std::to_string(i + 1) + " " + names[i]);
  }
  expected.push_back("OK " + (host.home / "dump.zip"));
  EXPECT_EQ(host.dumpProgress.lines, expected);
}

TEST_F(ServiceCollectionTest, EachFlagAloneRunsExactlyItsPlan) {
  prepareHost(host);
  for (unsigned bit = 0; bit < 18; ++bit) {
    const CollectionFlags flags = 1U << bit;
    host.dumpProgress.lines.clear();
    collect("Quillet", flags);
    advance(8s);
    std::size_t number = 0;
    Lines expected{"BEGIN Quillet " + (host.home / "dump")};
    for (const std::string& name : wantedNames(ServiceCollection::plan(request("Quillet", flags)))) {
      expected.push_back("STEP " + std::to_string(++number) + " " + name);
    }
    EXPECT_EQ(host.dumpProgress.lines, expected) << flags;
    finishArchives();
  }
}

TEST_F(ServiceCollectionTest, TwoCollectionsAtOnceEachEndInTheirOwnArchive) {
  CollectionRequest other = request("Vistel", kCollectSystemLogs);
  other.destination = host.home / "other";
  collect("Quillet", kCollectSystemLogs);
  collection.CollectServiceLogs(other, [this] { ++completions; });
  advance(8s);
  finishArchives();
  EXPECT_EQ(completions, 2);
  EXPECT_TRUE(exists("dump.zip"));
  EXPECT_TRUE(exists("other.zip"));
}

TEST_F(ServiceCollectionTest, WithoutRoomOnTheDiskTheBigStepsAreSkippedAndTheManifestSaysWhy) {
  host.keptStore.disk = {100U << 20U, 16U << 20U};
  Budgeted sparing(*this);
  put("Logs/RadioMarshal.log");
  sparing.budgeted.CollectServiceLogs(request("Vistel", kEveryStep & ~kCollectNetwork), {});
  advance(8s);
  Lines skipped;
  for (const PlannedStep& step : ServiceCollection::plan(request("Vistel", kEveryStep), true)) {
    if (!step.isWanted && step.whyNot == "over budget") skipped.push_back(step.name);
  }
  EXPECT_EQ(skipped,
            (Lines{"Media and radio logs", "Location", "System logs", "Baseband logs", "Packet captures"}));
  for (const std::string& line : host.dumpProgress.lines) {
    for (const std::string& step : skipped)
      EXPECT_FALSE(line.starts_with("STEP") && line.ends_with(" " + step)) << line;
  }
  EXPECT_FALSE(exists("dump/RadioMarshal"));
  EXPECT_TRUE(exists("dump/Registration"));
  EXPECT_EQ(linesWith("no room"), Lines{"notice: The disk has no room for the big logs of service Vistel"});
  const std::string manifest = host.fileCopier.endings.at(0);
  EXPECT_NE(manifest.find(R"("Location", "state": "skipped", "why": ["over budget"])"), std::string::npos)
      << manifest;
}

TEST_F(ServiceCollectionTest, WithQueuesWhatMayTakeLongLeavesTheCallingThreadAndKeepsItsOrder) {
  put("Location/fix.log");
  int waitsForWifi = 0;
  ServiceCollection queued{{.platform = host.platform,
                            .collectors = collectors,
                            .closing = closing,
                            .wait =
                                [&](std::binary_semaphore& signal, std::chrono::seconds) {
                                  ++waitsForWifi;
                                  EXPECT_EQ(host.dumpProgress.lines.back(), "STEP 2 Wi-Fi diagnostics");
                                  return signal.try_acquire();
                                },
                            .usesQueues = true}};
  const CollectionRequest wanted = request("Vistel", kEveryStep);
  queued.CollectServiceLogs(wanted, [this] { ++completions; });
  EXPECT_EQ(tree(), "");
  EXPECT_TRUE(exists("dump"));
  EXPECT_EQ(waitsForWifi, 0);
  ASSERT_TRUE(host.queues.runNext("global.default"));
  EXPECT_TRUE(exists("dump/TCPDump"));
  EXPECT_FALSE(exists("dump/Location"));
  EXPECT_EQ(waitsForWifi, 0);
  host.host.drain();
  EXPECT_EQ(waitsForWifi, 1);
  host.queues.runAll();
  advance(8s);
  finishArchives();
  EXPECT_EQ(completions, 1);
  Lines expected;
  std::size_t number = 0;
  for (const std::string& name : wantedNames(ServiceCollection::plan(wanted))) {
    expected.push_back("STEP " + std::to_string(++number) + " " + name);
  }
  Lines steps;
  for (const std::string& line : host.dumpProgress.lines) {
    if (line.starts_with("STEP")) steps.push_back(line);
  }
  EXPECT_EQ(steps, expected);
}

TEST_F(ServiceCollectionTest, TheLastCollectionLeavesNothingToTheQueues) {
  put("Logs/Reports/Vistel-1.crash");
  ServiceCollection queued{
      {.platform = host.platform, .collectors = collectors, .closing = closing, .usesQueues = true}};
  CollectionRequest last = request("Quillet", kCollectLocation);
  last.isLast = true;
  queued.CollectServiceLogs(last, {});
  EXPECT_TRUE(exists("dump/Location"));
  EXPECT_TRUE(exists("dump/System Logs/Vistel-1.crash"));
  EXPECT_EQ(host.queues.readyJobs("global.default"), 0U);
}

TEST_F(ServiceCollectionTest, AStepThatIsGivenUpHasFailedAndTheOthersGoOn) {
  duringTheWait = [] { throw std::runtime_error("no memory"); };
  put("Logs/Reports/Vistel-1.crash");
  collect("Quillet", kCollectMedia | kCollectLocation);
  EXPECT_EQ(linesWith("given up"),
            Lines{"warning: The step \"Wi-Fi diagnostics\" of a collection was given up: no memory"});
  EXPECT_TRUE(exists("dump/Location"));
  advance(8s);
  const std::string manifest = host.fileCopier.endings.at(0);
  EXPECT_NE(manifest.find(R"("Wi-Fi diagnostics", "state": "failed")"), std::string::npos) << manifest;
  EXPECT_NE(manifest.find(R"("why": ["no memory"])"), std::string::npos) << manifest;
  finishArchives();
  EXPECT_EQ(completions, 1);
}

TEST_F(ServiceCollectionTest, TheBudgetIsLookedAtWhenTheArchiveIsMade) {
  Budgeted collecting(*this);
  collecting.budgeted.CollectServiceLogs(request("Quillet", 0), {});
  advance(8s);
  ASSERT_EQ(host.keptStore.looks, 0);
  finishArchives();
  EXPECT_EQ(host.keptStore.looks, 1);
}

}  // namespace
}  // namespace zal
