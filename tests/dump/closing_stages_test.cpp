#include "dump/closing_stages.h"

#include "dump/planned_steps.h"
#include "tests/dump/collection_fixture.h"

namespace zal {
namespace {

using testing::listTree;
namespace fs = std::filesystem;
using Lines = std::vector<std::string>;
using namespace std::chrono_literals;

constexpr CollectionFlags kClosingFlags[] = {kCollectPushLogs, kCollectNetwork, kCollectBaseband,
                                             kCollectSystemLogs, kCollectStackshot};

class ClosingStagesTest : public testing::CollectionFixture {
 protected:
  ClosingStagesTest() {
    host.telephony.reachable = true;
    fs::create_directories(host.home / "dump/Power");
    fs::create_directories(host.home / "Logs/Vistel");
  }

  [[nodiscard]] ClosingWork work(CollectionFlags flags, const std::string& directory = "dump") {
    const std::string top = host.home / directory;
    return {.service = "Vistel",
            .destination = top,
            .pushLogs = top + "/Push Logs",
            .networkStack = top + "/Webstrand",
            .systemLogs = top + "/System Logs",
            .basebandLogs = top + "/Baseband Logs",
            .snapshots = top + "/Snapshots",
            .packetCaptures = top + "/TCPDump",
            .power = top + "/Power",
            .reason = {},
            .flags = flags,
            .startTime = host.host.wallNow(),
            .record = beginRecord(
                host.platform, collectors.witnesses,
                {.service = "Vistel", .directory = top, .flags = flags, .steps = ClosingStages::plan(flags)}),
            .firstStep = 1,
            .completion = [this] { ++completions; }};
  }
  void run(CollectionFlags flags) { closing.run(work(flags)); }
  /// What lies in the dump when its archive is begun.
  [[nodiscard]] std::string gathered(CollectionFlags flags) {
    host.fileCopier.holdsBack = true;
    run(flags);
    advance(8s);
    EXPECT_EQ(host.fileCopier.started.size(), 1U);
    return listTree(host.home / "dump");
  }
  [[nodiscard]] std::string marker() const { return host.home / "tmp/Telvane.dumping"; }

  int completions = 0;
};

TEST_F(ClosingStagesTest, SecondStageBeginsEightSecondsAfterTheFirst) {
  run(0);
  advance(7999ms);
  EXPECT_TRUE(host.fileCopier.started.empty());
  advance(1ms);
  EXPECT_EQ(host.fileCopier.started.size(), 1U);
}

TEST_F(ClosingStagesTest, FirstStageRunsInsideTheCallAndTheSecondOnTheStandardQueue) {
  put("Logs/Reports/Vistel-1.crash");
  put("Logs/Reports/zalagent-2024-05-02-140307.txt");
  run(0);
  EXPECT_TRUE(exists("dump/System Logs/Vistel-1.crash"));
  host.host.advance(8s);
  EXPECT_FALSE(exists("dump/Snapshots"));
  EXPECT_TRUE(host.queues.runNext("global.default"));
  EXPECT_TRUE(exists("dump/Snapshots/zalagent-2024-05-02-140307.txt"));
}

TEST_F(ClosingStagesTest, ThermalLogAndCrashLogsAreTakenWhateverTheFlags) {
  put("tmp/vistel_thermal_log.txt");
  put("Logs/Reports/Orrisd-1.crash");
  put("Logs/Reports/Webstrand-1.crash");
  put("Logs/tcpdump_en0-full.pcap");
  put("Logs/tcpdump_beacond_en0-0");
  EXPECT_EQ(gathered(0), "Power/\nPower/vistel_thermal_log.txt\nSystem Logs/\nSystem Logs/Orrisd-1.crash\n");
}

TEST_F(ClosingStagesTest, NetworkStackCrashLogsAndTheFullCaptureComeWithPushLogsAndWithTheNetworkDump) {
  put("System/Reports/Webstrand-1.crash");
  put("Logs/tcpdump_en0-full.pcap");
  put("Logs/tcpdump_beacond_en0-1");
  const std::string common =
      "Power/\nTCPDump/\nTCPDump/tcpdump_en0-full.pcap\n"
      "Webstrand/\nWebstrand/Webstrand-1.crash\n";
  EXPECT_EQ(gathered(kCollectNetwork), common);
}

TEST_F(ClosingStagesTest, PushLogsBringThePushClientsStateItsCapturesAndTheNetworkStackLogs) {
  host.configuration.collection.pushLogDirectory = host.home / "PushClient";
  put("PushClient/courier.log");
  put("System/Reports/Webstrand-1.crash");
  put("Logs/tcpdump_en0-full.pcap");
  put("Logs/tcpdump_beacond_en0-1");
  EXPECT_EQ(gathered(kCollectPushLogs),
            "Power/\nPush Logs/\nPush Logs/courier.log\n"
            "TCPDump/\nTCPDump/tcpdump_beacond_en0-1.pcap\nTCPDump/tcpdump_en0-full.pcap\n"
            "Webstrand/\nWebstrand/Webstrand-1.crash\n");
  EXPECT_EQ(host.shell.commands, (Lines{"/usr/local/bin/pushprobe -dumpState > \"" +
                                            (host.home / "dump/Push Logs") + "/pushprobe_state.txt\"  2>&1 &",
                                        "/usr/bin/killall -9 tessel"}));
}

TEST_F(ClosingStagesTest, SystemLogsAreThoseSinceTheStartOfTheCollection) {
  put("Wireless/Reports/SystemLog-2024-05-02-140200.log");
  put("Wireless/Reports/SystemLog-2024-05-02-140307.log");
  EXPECT_EQ(gathered(kCollectSystemLogs),
            "Power/\nSystem Logs/\nSystem Logs/SystemLog-2024-05-02-140307.log\n");
}

TEST_F(ClosingStagesTest, StackshotCarriesItsReasonAndCode) {
  run(kCollectStackshot);
  EXPECT_EQ(host.crashReporter.stackshots, Lines{"ZalLogging Log Dump"});
  EXPECT_EQ(host.crashReporter.stackshotCodes, std::vector<std::uint32_t>{0xF33D1337U});
}

TEST_F(ClosingStagesTest, OnlyTheStackshotBitAsksForAStackshot) {
  run(0x5F);
  EXPECT_TRUE(host.crashReporter.stackshots.empty());
  run(0x7F);
  EXPECT_EQ(host.crashReporter.stackshots.size(), 1U);
}

TEST_F(ClosingStagesTest, BasebandSnapshotHasTheReasonOrElseTheServicesName) {
  run(kCollectBaseband);
  ClosingWork withReason = work(kCollectBaseband);
  withReason.reason = "it fell silent";
  closing.run(std::move(withReason));
  EXPECT_EQ(host.telephony.basebandDumps, (Lines{"Baseband dump for Vistel logging", "it fell silent"}));
}

TEST_F(ClosingStagesTest, HostThatMakesNoStackshotAndHasNoTelephonySaysWhatIsMissing) {
  host.crashReporter.available = false;
  host.telephony.reachable = false;
  run(kCollectStackshot | kCollectBaseband);
  EXPECT_EQ(host.dumpProgress.lines,
            (Lines{"BEGIN Vistel " + (host.home / "dump"), "STEP 1 Thermal log", "STEP 2 Stackshot",
                   "MISSING Stackshot: the host's crash service made none", "STEP 3 Baseband snapshot",
                   "MISSING Baseband snapshot: the telephony service cannot be reached", "STEP 4 Crash logs",
                   "STEP 5 Waiting for slow writers"}));
}

TEST_F(ClosingStagesTest, CapturesAreStoppedAfterTheCrashLogs) {
  run(kCollectSystemLogs);
  ASSERT_EQ(host.shell.commands.size(), 5U);
  EXPECT_EQ(host.shell.commands.back(), "/usr/bin/killall -9 tessel");
}

TEST_F(ClosingStagesTest, AStepThatIsGivenUpHasFailedAndTheArchiveIsMadeAllTheSame) {
  host.shell.respond = [](const std::string&) -> int { throw std::runtime_error("no thread"); };
  put("Logs/Reports/zalagent-2024-05-02-140307.txt");
  run(0);
  EXPECT_EQ(linesWith("given up"),
            Lines{"warning: The step \"Waiting for slow writers\" of a collection was given up: no thread"});
  advance(8s);
  const std::string manifest = host.fileCopier.endings.at(0);
  EXPECT_NE(manifest.find(R"("Waiting for slow writers", "state": "failed")"), std::string::npos) << manifest;
  EXPECT_NE(manifest.find(R"("Snapshots", "state": "done")"), std::string::npos) << manifest;
  EXPECT_EQ(completions, 1);
}

TEST_F(ClosingStagesTest, BasebandDumpIsLookedAtOnceASecondUntilItIsComplete) {
  testing::writeFile(marker(), "");
  put("Wireless/Logs/Telvane.log");
  const std::string waiting = "notice: Baseband not complete dumping, file " + marker() + " still exists";
  const std::string complete = "notice: Baseband complete dumping, file " + marker() + " doesn't exist";
  run(kCollectBaseband);
  advance(7999ms);
  EXPECT_EQ(linesWith("complete dumping"), Lines{});
  advance(1ms);
  EXPECT_EQ(linesWith("complete dumping"), Lines{waiting});
  advance(999ms);
  EXPECT_EQ(linesWith("complete dumping"), Lines{waiting});
  advance(1ms);
  EXPECT_EQ(linesWith("complete dumping"), (Lines{waiting, waiting}));
  fs::remove(marker());
  advance(999ms);
  EXPECT_TRUE(host.fileCopier.started.empty());
  host.fileCopier.holdsBack = true;
  advance(1ms);
  EXPECT_EQ(linesWith("complete dumping"), (Lines{waiting, waiting, complete}));
  EXPECT_EQ(host.fileCopier.started.size(), 1U);
  EXPECT_TRUE(exists("dump/Baseband Logs/Telvane.log"));
}

TEST_F(ClosingStagesTest, BasebandDumpThatNeverEndsIsNeverGivenUp) {
  testing::writeFile(marker(), "");
  run(kCollectBaseband);
  advance(8s);
  for (int second = 0; second < 3600; ++second) advance(1s);
  EXPECT_EQ(linesWith("not complete dumping").size(), 3601U);
  EXPECT_EQ(completions, 0);
  fs::remove(marker());
  advance(1s);
  EXPECT_EQ(completions, 1);
}

TEST_F(ClosingStagesTest, MarkerIsNotLookedAtWithoutTheBasebandBit) {
  testing::writeFile(marker(), "");
  run(0x7F & ~kCollectBaseband);
  advance(8s);
  EXPECT_EQ(linesWith("dumping"), Lines{});
  EXPECT_EQ(completions, 1);
}

TEST_F(ClosingStagesTest, HundredWaitingDumpsHoldAHundredTimersAndNoThread) {
  testing::writeFile(marker(), "");
  for (int i = 0; i < 100; ++i) closing.run(work(kCollectBaseband, "dump" + std::to_string(i)));
  EXPECT_EQ(host.host.pendingTimers(), 100U);
  advance(8s);
  advance(1s);
  EXPECT_EQ(host.host.pendingTimers(), 100U);
  EXPECT_EQ(host.queues.readyJobs("global.default"), 0U);
  fs::remove(marker());
  advance(1s);
  EXPECT_EQ(completions, 100);
  EXPECT_EQ(host.host.pendingTimers(), 0U);
}

TEST_F(ClosingStagesTest, ArchiveIsLinkedRecordedAndThenTheCompletionRunsOnceOnTheMainThread) {
  run(0);
  advance(8s);
  const std::string archive = host.home / "dump.zip";
  EXPECT_EQ(completions, 1);
  EXPECT_TRUE(fs::exists(archive));
  EXPECT_FALSE(exists("dump"));
  EXPECT_EQ(fs::read_symlink(host.home / "Logs/Vistel/Latest-Vistel"), archive);
  EXPECT_EQ(host.dumpProgress.lines.back(), "OK " + archive);
  EXPECT_EQ(linesWith("Starting compression"),
            Lines{"notice: Starting compression for item at path: " + (host.home / "dump")});
  advance(1h);
  EXPECT_EQ(completions, 1);
}

TEST_F(ClosingStagesTest, LinkRecordAndCompletionWaitForTheMainThread) {
  run(0);
  host.host.advance(8s);
  ASSERT_TRUE(host.queues.runNext("global.default"));  // the second stage
  host.host.drain();                                   // the copier's completion
  ASSERT_TRUE(host.queues.runNext("global.default"));  // the archive moves into place
  EXPECT_EQ(completions, 0);
  EXPECT_FALSE(exists("Logs/Vistel/Latest-Vistel"));
  host.host.drain();
  EXPECT_EQ(completions, 1);
  EXPECT_TRUE(exists("Logs/Vistel/Latest-Vistel"));
}

TEST_F(ClosingStagesTest, LatestLinkIsReplaced) {
  fs::create_symlink("/old/archive.zip", host.home / "Logs/Vistel/Latest-Vistel");
  run(0);
  advance(8s);
  EXPECT_EQ(fs::read_symlink(host.home / "Logs/Vistel/Latest-Vistel"), host.home / "dump.zip");
}

TEST_F(ClosingStagesTest, LogRootMayBeginWithTheHomeMark) {
  host.configuration.roots.UserLogRoot = "~/Logs";
  run(0);
  advance(8s);
  EXPECT_EQ(fs::read_symlink(host.home / "Logs/Vistel/Latest-Vistel"), host.home / "dump.zip");
}

TEST_F(ClosingStagesTest, ServiceNameThatLeadsOutOfTheLogRootGetsNoLink) {
  ClosingWork hostile = work(0);
  hostile.service = "../Vistel";
  closing.run(std::move(hostile));
  advance(8s);
  EXPECT_EQ(linesWith("warning: "),
            Lines{"warning: Refused the link to the latest archive of \"../Vistel\": its name leads out of "
                  "the log directory"});
  EXPECT_EQ(completions, 1);
}

TEST_F(ClosingStagesTest, WithoutAnArchiveTheRecordSaysSoAndTheCompletionRunsAllTheSame) {
  host.fileCopier.writesArchives = false;
  run(0);
  advance(8s);
  EXPECT_EQ(host.dumpProgress.lines.back(), "FAILED no archive was made; the log says why");
  EXPECT_EQ(completions, 1);
}

TEST_F(ClosingStagesTest, MissingCompletionIsNoMatter) {
  ClosingWork silent = work(0);
  silent.completion = nullptr;
  closing.run(std::move(silent));
  advance(8s);
  EXPECT_TRUE(exists("dump.zip"));
}

TEST_F(ClosingStagesTest, CommandsThatStillWriteAreNamedWhenTheArchiveIsMade) {
  const std::string trace = host.home / "dump/Network/traceroute.log";
  host.processes.writers = {{.processId = 7, .command = "traceroute -m 10", .file = trace},
                            {.processId = 9, .command = "elsewhere", .file = host.home / "dump2/x.log"}};
  run(0);
  EXPECT_EQ(linesWith("Still running"), Lines{});
  advance(8s);
  EXPECT_EQ(linesWith("Still running"),
            Lines{"notice: Still running when archived: traceroute -m 10 (process 7), writing " + trace});
  const Lines& record = host.dumpProgress.lines;
  ASSERT_GE(record.size(), 2U);
  EXPECT_EQ(record[record.size() - 2],
            "MISSING Network/traceroute.log: still running when archived: traceroute -m 10");
}

TEST_F(ClosingStagesTest, OutputsOfProgramsThatAreNotThereAreNamedWhenTheArchiveIsMade) {
  testing::writeFile(host.home / "dump/Network/voltra.log", "sh: 1: /usr/bin/voltra: not found\n");
  run(0);
  advance(8s);
  const Lines& record = host.dumpProgress.lines;
  EXPECT_EQ(record[record.size() - 2], "MISSING Network/voltra.log: /usr/bin/voltra: not found");
}

TEST_F(ClosingStagesTest, StepsOfAllFlagsRunInTheOrderOfThePlan) {
  run(0x7F);
  advance(8s);
  EXPECT_EQ(host.dumpProgress.lines,
            (Lines{"BEGIN Vistel " + (host.home / "dump"), "STEP 1 Push logs", "STEP 2 Network stack logs",
                   "STEP 3 Thermal log", "STEP 4 Stackshot", "STEP 5 Baseband snapshot", "STEP 6 System logs",
                   "STEP 7 Crash logs", "STEP 8 Waiting for slow writers", "STEP 9 Baseband logs",
                   "STEP 10 Snapshots", "STEP 11 Packet captures", "STEP 12 Archive",
                   "OK " + (host.home / "dump.zip")}));
}

TEST_F(ClosingStagesTest, EveryCombinationOfFlagsRunsExactlyItsPlan) {
  for (unsigned combination = 0; combination < 32; ++combination) {
    CollectionFlags flags = 0;
    for (unsigned bit = 0; bit < 5; ++bit) {
      if ((combination & (1U << bit)) != 0) flags |= kClosingFlags[bit];
    }
    host.dumpProgress.lines.clear();
    run(flags);
    advance(8s);
    std::size_t number = 0;
    Lines expected{"BEGIN Vistel " + (host.home / "dump")};
    for (const std::string& name : wantedNames(ClosingStages::plan(flags))) {
      expected.push_back("STEP " + std::to_string(++number) + " " + name);
    }
    host.dumpProgress.lines.pop_back();
    EXPECT_EQ(host.dumpProgress.lines, expected) << flags;
  }
}

TEST_F(ClosingStagesTest, ArchiveEndsWithAManifestOfAllStepsAndFiles) {
  host.fileCopier.content.files = {{"Power/log.txt", 3, "ab12", false}};
  run(0);
  advance(8s);
  ASSERT_EQ(host.fileCopier.endings.size(), 1U);
  const std::string& manifest = host.fileCopier.endings[0];
  for (const char* row :
       {R"({"step": "Stackshot", "state": "skipped", "why": ["flag 0x20 is not set"]})",
        R"({"step": "Thermal log", "state": "missing", "began": "2024-05-02T)",
        R"({"step": "Waiting for slow writers", "state": "done", "began": "2024-05-02T)",
        R"("milliseconds": 8000)", R"({"file": "Power/log.txt", "bytes": 3, "sha256": "ab12"})"}) {
    EXPECT_NE(manifest.find(row), std::string::npos) << row << " in " << manifest;
  }
}

TEST_F(ClosingStagesTest, WhatAFormerAgentGatheredIsArchivedAndLinkedAtTheStart) {
  put("dump/Phone/Phone.log");
  put("archived/x");
  put("archived.zip");
  host.dumpProgress.cutOffDumps = {
      {"Vistel", host.home / "dump", {{"Crash logs", true}, {"Snapshots", false}, {"Archive", false}}},
      {"Vistel", host.home / "archived", {{"Archive", true}}},
      {"Vistel", host.home / "gone", {}}};
  closing.finishCutOff();
  EXPECT_TRUE(host.fileCopier.started.empty());
  host.queues.runAll();
  ASSERT_EQ(host.fileCopier.started.size(), 1U);
  EXPECT_EQ(host.fileCopier.started[0].input, host.home / "dump");
  EXPECT_EQ(fs::read_symlink(host.home / "Logs/Vistel/Latest-Vistel"), host.home / "dump.zip");
  EXPECT_EQ(host.dumpProgress.lines, (Lines{"BEGIN Vistel " + (host.home / "dump"), "STEP 1 Archive",
                                            "OK " + (host.home / "dump.zip")}));
  EXPECT_NE(host.fileCopier.endings.at(0).find(R"("finishedLater": true)"), std::string::npos);
  EXPECT_EQ(completions, 0);
}

TEST_F(ClosingStagesTest, OfAnArchiveThatHadItsNameTheDirectoryGoesAndTheLinkIsMade) {
  put("dump/half a file");
  put("dump.zip");
  put("other/of a collection");
  put("other.zip");
  put("Logs/Vistel/Vistel.log");
  host.dumpProgress.cutOffDumps = {
      {"Vistel", host.home / "dump", {{"Snapshots", true}, {"Archive", false}}},
      {"Vistel", host.home / "dump", {{"Archive", true}}},  // by the agent that finished it
      {"Messages", host.home / "other", {{"Snapshots", true}, {"Archive", false}}}};
  closing.finishCutOff();
  host.queues.runAll();
  EXPECT_FALSE(fs::exists(host.home / "dump"));
  EXPECT_EQ(fs::read_symlink(host.home / "Logs/Vistel/Latest-Vistel"), host.home / "dump.zip");
  // An archive that was there before this one was begun is none of it.
  EXPECT_TRUE(fs::exists(host.home / "other/of a collection"));
  EXPECT_TRUE(host.fileCopier.started.empty());
}

TEST_F(ClosingStagesTest, WhatWasRecoveredIntoTheDirectoryOfAnArchiveStays) {
  put("dump.zip");
  put("dump/Log (14-03-07).log");
  fs::last_write_time(host.home / "dump.zip", fs::last_write_time(host.home / "dump.zip") - 1h);
  host.dumpProgress.cutOffDumps = {{"Vistel", host.home / "dump", {{"Archive", true}}}};
  closing.finishCutOff();
  host.queues.runAll();
  EXPECT_TRUE(fs::exists(host.home / "dump/Log (14-03-07).log"));
}

TEST_F(ClosingStagesTest, WhatEndedThreeAgentsIsNotTriedAgain) {
  const CutOffDump dump{"Vistel", host.home / "dump", {}};
  host.dumpProgress.cutOffDumps = {dump, dump, dump, dump};
  closing.finishCutOff();
  host.queues.runAll();
  EXPECT_TRUE(host.fileCopier.started.empty());
  host.dumpProgress.cutOffDumps.pop_back();
  closing.finishCutOff();
  host.queues.runAll();
  EXPECT_EQ(host.fileCopier.started.size(), 1U);
}

TEST_F(ClosingStagesTest, FirstStepOfAPlanThatBeganEarlierIsCountedOn) {
  ClosingWork later = work(0);
  std::vector<PlannedStep> steps = ClosingStages::plan(0);
  steps.insert(steps.begin(), {.name = "an earlier step", .isWanted = true, .whyNot = ""});
  later.record = beginRecord(host.platform, collectors.witnesses,
                             {.service = "Vistel", .directory = "d", .flags = 0, .steps = steps});
  later.firstStep = 2;
  closing.run(std::move(later));
  EXPECT_EQ(host.dumpProgress.lines.back(), "STEP 4 Waiting for slow writers");
}

}  // namespace
}  // namespace zal
