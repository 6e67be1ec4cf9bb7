#include "dump/action_dispatcher.h"

#include <gmock/gmock.h>

#include <filesystem>
#include <limits>

#include "dump/planned_steps.h"
#include "tests/dump/action_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

class ActionDispatcherTest : public testing::ActionFixture {
 protected:
  /// The plan of the only collection.
  [[nodiscard]] const DumpPlan& plan() const { return fake.dumpProgress.plans.at(0); }
  void putLogSet(const std::string& name) {
    testing::writeFile(fake.configuration.roots.UserLogRoot + "/" + name + "/" + name + ".log", name);
  }
  /// How many have begun, by what each says in the log.
  [[nodiscard]] std::size_t networkDumps() const {
    std::size_t count = 0;
    for (const std::string& line : fake.agentLog.lines) {
      if (line == "notice: **** Generating network logs ****") ++count;
    }
    return count;
  }
};

TEST_F(ActionDispatcherTest, CodesWithoutAMeaningDoNothing) {
  constexpr std::int64_t kHigh = std::int64_t{1} << 32;
  for (const std::int64_t code :
       {std::int64_t{5}, std::int64_t{6}, std::int64_t{12}, std::int64_t{13}, std::int64_t{16},
        std::int64_t{1000}, std::int64_t{-1}, kHigh + 3, kHigh + 14, std::numeric_limits<std::int64_t>::min(),
        std::numeric_limits<std::int64_t>::max()}) {
    const std::string before = testing::listTree(fake.home.path());
    perform(code, "Vistel", {{"useWifi", true}, {"target", "kim"}, {"displayFlags", std::int64_t{2}}});
    finish();
    EXPECT_EQ(testing::listTree(fake.home.path()), before) << code;
  }
  EXPECT_THAT(server.calls, IsEmpty());
  EXPECT_THAT(alertTexts(), IsEmpty());
  EXPECT_THAT(fake.shell.commands, IsEmpty());
  EXPECT_THAT(fake.agentLog.lines, IsEmpty());
  EXPECT_THAT(fakePeer->replies, IsEmpty());
}

TEST_F(ActionDispatcherTest, ABasebandSnapshotIsTakenWithTheReasonOrTheLabel) {
  fake.telephony.reachable = true;
  perform(0, "Vistel", {{"reasonForSnapshot", "no voice"}});
  performWith(0, "Vistel", nullptr, &message);
  EXPECT_THAT(fake.telephony.basebandDumps, IsEmpty());
  finish();
  EXPECT_THAT(fake.telephony.basebandDumps,
              ElementsAre("no voice", "Baseband dump for Vistel/Quillet logging"));
}

TEST_F(ActionDispatcherTest, VideoCallLogsAreCollectedIntoAReceiversDirectoryWithTheUsualFlags) {
  perform(1);
  EXPECT_THAT(fake.dumpProgress.plans, SizeIs(1));
  EXPECT_EQ(plan().service, "Vistel");
  EXPECT_EQ(plan().directory, receiverDirectory(root));
  EXPECT_EQ(plan().steps, wantedNames(ServiceCollection::plan({.service = "Vistel",
                                                               .destination = "",
                                                               .reason = std::nullopt,
                                                               .background = false,
                                                               .flags = 0x5F})));
  EXPECT_THAT(plan().steps, Not(Contains("Stackshot")));
}

TEST_F(ActionDispatcherTest, VideoCallLogsEndWithOneAlertAndNoReply) {
  perform(1);
  EXPECT_THAT(alertTexts(), IsEmpty());
  finish();
  EXPECT_THAT(alertTexts(),
              ElementsAre(std::string("CopyLogs | Vistel Logging | Logs have been successfully captured and "
                                      "stored in this file: ") +
                          kTime + " (Receiver).zip"));
  EXPECT_EQ(alerts()[0].defaultButton, "OK");
  EXPECT_EQ(alerts()[0].alternateButton, std::nullopt);
  EXPECT_EQ(alerts()[0].otherButton, std::nullopt);
  EXPECT_FALSE(fake.userAlerts.posted[0].listener);
  EXPECT_THAT(fakePeer->replies, IsEmpty());
  EXPECT_THAT(fake.systemNotifications.posts, IsEmpty());
}

TEST_F(ActionDispatcherTest, TheSecondCompressionOfVideoCallLogsLeavesTheFirstArchive) {
  for (const char* set : {"Vistel", "Nexa", "NexaIDQuery", "Transport", "Registration"}) putLogSet(set);
  perform(1);
  fake.fileCopier.holdsBack = true;
  finish();
  ASSERT_THAT(fake.fileCopier.heldBack, SizeIs(1));
  fake.fileCopier.heldBack[0]();
  finish();
  ASSERT_THAT(fake.fileCopier.heldBack, SizeIs(2));
  // What the second one finds: only the log sets, each under its name.
  EXPECT_EQ(
      testing::listTree(receiverDirectory(root)),
      "Nexa/\nNexa/Nexa.log\nNexaIDQuery/\nNexaIDQuery/NexaIDQuery.log\nTransport/\nTransport/Transport.log\n"
      "Vistel/\nVistel/Vistel.log\n");
  testing::writeFile(receiverDirectory(root) + ".zip", "the first archive");
  fake.fileCopier.heldBack[1]();
  finish();
  EXPECT_EQ(testing::readFile(receiverDirectory(root) + ".zip"), "the first archive");
  EXPECT_FALSE(std::filesystem::exists(receiverDirectory(root)));
  EXPECT_EQ(testing::readFile(fake.fileCopier.started.at(1).output), "archive of " + receiverDirectory(root));
  EXPECT_THAT(alertTexts(), SizeIs(1));
}

TEST_F(ActionDispatcherTest, TheVeryFirstNetworkDumpOnlyNotesAPoorNetwork) {
  perform(2);
  finish();
  EXPECT_EQ(networkDumps(), 0U);
  EXPECT_THAT(server.calls, ElementsAre("poor network"));
  EXPECT_FALSE(std::filesystem::exists(root + "/Vistel"));
}

TEST_F(ActionDispatcherTest, ANetworkDumpFollowsOnlyAfterMoreThan40Seconds) {
  perform(2);
  fake.host.advance(40s);
  perform(2);
  fake.queues.runAll();
  EXPECT_EQ(networkDumps(), 0U);
  fake.host.advance(1ms);
  perform(2);
  fake.queues.runAll();
  EXPECT_EQ(networkDumps(), 1U);
  EXPECT_TRUE(std::filesystem::is_directory(root + "/Vistel/2024-05-02 at 14-03-47 (CEST) (Receiver)"));
  EXPECT_THAT(server.calls, ElementsAre("poor network", "poor network", "poor network"));
}

TEST_F(ActionDispatcherTest, ASecondNetworkDumpWithin40SecondsOnlyNotesAPoorNetwork) {
  perform(2);
  fake.host.advance(41s);
  perform(2);
  fake.host.advance(39999ms);
  perform(2);
  fake.queues.runAll();
  EXPECT_EQ(networkDumps(), 1U);
  fake.host.advance(2ms);
  perform(2);
  fake.queues.runAll();
  EXPECT_EQ(networkDumps(), 2U);
  EXPECT_THAT(server.calls, SizeIs(4));
}

TEST_F(ActionDispatcherTest, AWallClockThatJumpsBackCountsAsTimePassed) {
  perform(2);
  fake.host.setWall(fake.host.wallNow() - 1h);
  perform(2);
  fake.queues.runAll();
  EXPECT_EQ(networkDumps(), 1U);
}

TEST_F(ActionDispatcherTest, NetworkDumpsTakePings) {
  fake.configuration.endpoints.reportServer = "report.example";
  perform(2);
  fake.host.advance(41s);
  perform(2);
  finish();
  EXPECT_THAT(fake.pings.tests, Not(IsEmpty()));
}

TEST_F(ActionDispatcherTest, APoorNetworkIsPassedOn) {
  perform(3);
  EXPECT_THAT(server.calls, ElementsAre("poor network"));
}

TEST_F(ActionDispatcherTest, RegistrationLogsAreLinkedIntoTheReportRoot) {
  putLogSet("Registration");
  putLogSet("Nexa");
  fake.configuration.roots.DiagnosticReportRoot = "~/Logs/Reports";
  perform(4);
  EXPECT_EQ(testing::listTree(root), "Registration/\nRegistration/Registration.log\n");
  EXPECT_THAT(alertTexts(), IsEmpty());
}

TEST_F(ActionDispatcherTest, MessagingLogsAreCollectedWithTheReasonBesideTheRegistrationLogs) {
  putLogSet("Registration");
  fake.telephony.reachable = true;
  perform(7, "Vistel", {{"reasonForSnapshot", "no delivery"}});
  EXPECT_EQ(testing::readFile(root + "/Registration/Registration.log"), "Registration");
  ASSERT_THAT(fake.dumpProgress.plans, SizeIs(1));
  EXPECT_EQ(plan().service, "Quillet");
  EXPECT_EQ(plan().directory, receiverDirectory(root));
  EXPECT_EQ(plan().steps, wantedNames(ServiceCollection::plan({.service = "Quillet",
                                                               .destination = "",
                                                               .reason = std::nullopt,
                                                               .background = false,
                                                               .flags = 0x5F})));
  finish();
  EXPECT_THAT(fake.telephony.basebandDumps, ElementsAre("no delivery"));
  EXPECT_THAT(fake.fileCopier.started, SizeIs(1));
  EXPECT_THAT(alertTexts(), IsEmpty());
  EXPECT_THAT(fakePeer->replies, IsEmpty());
}

TEST_F(ActionDispatcherTest, MessagingLogsDoWithoutAReason) {
  fake.telephony.reachable = true;
  performWith(7, std::nullopt, nullptr, nullptr);
  finish();
  EXPECT_THAT(fake.telephony.basebandDumps, ElementsAre("Baseband dump for Quillet logging"));
}

TEST_F(ActionDispatcherTest, ASessionDirectoryThatCannotBeMadeChangesNothingElse) {
  testing::writeFile(root + "/Vistel", "a file in the way");
  perform(7);
  perform(1);
  finish();
  EXPECT_EQ(testing::readFile(root + "/Vistel"), "a file in the way");
  EXPECT_THAT(alertTexts(), SizeIs(1));
}

TEST_F(ActionDispatcherTest, AutomationIsStartedAndStopped) {
  fake.configuration.internalInstall = true;
  perform(8);
  perform(9);
  perform(10, "Vistel", {{"target", "kim"}});
  perform(11);
  EXPECT_THAT(server.calls,
              ElementsAre("automation runs", "automation stopped", "automation runs", "automation stopped"));
  fake.queues.runAll();
  EXPECT_THAT(fake.shell.commands, SizeIs(4));
}

TEST_F(ActionDispatcherTest, APingTestStartsWhenTheInterfaceIsGiven) {
  perform(15, "Vistel", {{"useWifi", true}});
  perform(15, "Messages", {{"useWifi", false}});
  perform(15, std::nullopt, {{"useWifi", std::int64_t{1}}});
  EXPECT_THAT(server.calls, ElementsAre("ping Vistel Wi-Fi", "ping Messages cellular", "ping (none) Wi-Fi"));
}

TEST_F(ActionDispatcherTest, WithoutUseWifiThereIsNoPingTest) {
  perform(15);
  performWith(15, "Vistel", nullptr, &message);
  EXPECT_THAT(server.calls, IsEmpty());
}

}  // namespace
}  // namespace zal
