#include <signal.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>

#include "tests/e2e/dump_fixture.h"

namespace zal {
namespace {

using ::testing::AllOf;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::EndsWith;
using testing::eventually;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::IsSupersetOf;
using ::testing::Not;
using testing::readFile;
using ::testing::SizeIs;
using testing::writeFile;

using State = DumpProgressRecord::State;

/// Dumps of the real daemon, asked for through the client library, on this machine's real state.
class DumpE2eTest : public testing::DumpFixture {};

TEST_F(DumpE2eTest, ADumpIsOneArchiveWithThisMachinesState) {
  start();
  writeFile(sandbox.reportRoot() + "/Vistel_crash.txt", "a crash report\n");
  lirra::Client client = makeClient();
  client.log("Vistel", "Default", "said by a client");
  holdSecondStage();
  // Network, baseband and system logs.
  const std::uint64_t ticket = ask(client, "Vistel", 0x0E);
  // The last step of the network dump runs when all others were started.
  ASSERT_TRUE(eventually([&] { return reportsEndingWith("/Console/syslog-end.log").size() == 1; }));
  ASSERT_TRUE(eventually([&] {
    for (const char* file : {"/Console/df-h.txt", "/Console/ps.txt", "/Statistics/ifconfig.log"}) {
      const auto found = reportsEndingWith(file);
      if (found.size() != 1 || std::filesystem::file_size(found[0]) == 0) return false;
    }
    return true;
  }));
  releaseSecondStage();
  const std::string archive = archiveOf(client, ticket);
  ASSERT_TRUE(std::filesystem::exists(archive)) << archive;
  EXPECT_THAT(archive, HasSubstr(sandbox.reportRoot() + "/Vistel/Vistel-Log ("));
  EXPECT_THAT(archive, EndsWith(") (Vistel).zip"));
  EXPECT_THAT(
      entriesOf(archive),
      IsSupersetOf({"Device_Info.txt", "Reason.txt", "Vistel/Vistel.log", "Network/CT/CTState.plist",
                    "Network/Console/df-h.txt", "Network/Console/ps.txt", "Network/Console/syslog-end.log",
                    "Network/Other/confquill--dns.log", "Network/Statistics/ifconfig.log",
                    "System Logs/Vistel_crash.txt", "System Logs/syslog.log"}));
  EXPECT_EQ(textIn(archive, "Reason.txt"), "Vistel");
  EXPECT_THAT(textIn(archive, "Vistel/Vistel.log"), HasSubstr("said by a client"));
  EXPECT_THAT(textIn(archive, "Network/Console/df-h.txt"), HasSubstr("Filesystem"));
  EXPECT_THAT(textIn(archive, "Network/Statistics/ifconfig.log"), HasSubstr("lo"));
  EXPECT_FALSE(std::filesystem::exists(archive.substr(0, archive.size() - 4)));
  EXPECT_EQ(std::filesystem::read_symlink(sandbox.logRoot() + "/Vistel/Latest-Vistel"), archive);

  const auto all = records();
  ASSERT_THAT(all, SizeIs(1));
  EXPECT_EQ(all[0].record.state, State::done);
  EXPECT_EQ(all[0].record.archivePath, archive);
  EXPECT_EQ(all[0].record.currentStep, all[0].record.steps.size());
  EXPECT_THAT(alerts(), IsEmpty());
  EXPECT_EQ(agent->terminate(), 0);
}

TEST_F(DumpE2eTest, TwoDumpsAtOnceAreTwoWholeArchives) {
  start();
  lirra::Client one = makeClient();
  lirra::Client two = makeClient();
  one.log("Vistel", "Default", "of the first");
  two.log("Registration", "Default", "of the second");
  ASSERT_EQ(one.flush(60'000), LIRRA_OK);
  ASSERT_EQ(two.flush(60'000), LIRRA_OK);
  const std::uint64_t first = ask(one, "Vistel", 0x1F);
  const std::uint64_t second = ask(two, "Registration", 0x1F);
  const std::string firstArchive = archiveOf(one, first);
  const std::string secondArchive = archiveOf(two, second);
  EXPECT_THAT(entriesOf(firstArchive), IsSupersetOf({"Reason.txt", "Vistel/Vistel.log"}));
  EXPECT_THAT(entriesOf(secondArchive), IsSupersetOf({"Reason.txt", "Registration/Registration.log"}));
  EXPECT_THAT(reportsEndingWith(" (not archived)"), IsEmpty());
}

TEST_F(DumpE2eTest, ADumpDuringACallLeavesTheCallAlone) {
  start();
  lirra::Client client = makeClient();
  client.beginSession("Vistel");
  client.checkpoint("Vistel", "before", 1714651381.5);
  const std::uint64_t ticket = ask(client, "Messages", 0x2F);
  client.checkpoint("Vistel", "during", 1714651382.5);
  EXPECT_THAT(entriesOf(archiveOf(client, ticket)), Contains("Reason.txt"));
  client.checkpoint("Vistel", "after", 1714651383.5);
  client.endSession("Vistel");
  ASSERT_EQ(client.flush(60'000), LIRRA_OK);
  // The session's own collection follows and archives its directory.
  ASSERT_TRUE(eventually([&] { return reportsEndingWith("(Receiver).zip").size() == 1; }));
  const std::string archive = reportsEndingWith("(Receiver).zip")[0];
  ASSERT_TRUE(
      eventually([&] { return std::filesystem::is_symlink(sandbox.logRoot() + "/Vistel/Latest-Vistel"); }));
  for (const std::string& entry : entriesOf(archive)) {
    if (!entry.starts_with("Log (")) continue;
    EXPECT_THAT(textIn(archive, entry), AllOf(HasSubstr("before"), HasSubstr("during"), HasSubstr("after"),
                                              HasSubstr("End Session")));
    return;
  }
  FAIL() << "no simple log in " << archive;
}

TEST_F(DumpE2eTest, TheStackshotOfThisDumpIsInItsArchiveAndNoOlderOne) {
  if (std::system((testing::ownProcessIds() + " true 2>/dev/null").c_str()) != 0)
    GTEST_SKIP() << "unshare cannot give a process ids of its own here";
  writeFile(sandbox.reportRoot() + "/Homeframe+2024-05-02-140307.stackshot", "of an earlier dump");
  start();
  lirra::Client client = makeClient();
  holdSecondStage();
  const std::uint64_t ticket = ask(client, "Messages", 0x2C);
  ASSERT_TRUE(eventually([&] { return reportsEndingWith(".stackshot").size() == 2; })) << output();
  std::vector<std::string> made = reportsEndingWith(".stackshot");
  std::sort(made.begin(), made.end());  // the later one has the later time
  const std::string name = std::filesystem::path(made.back()).filename().string();
  releaseSecondStage();
  const std::string archive = archiveOf(client, ticket);
  std::vector<std::string> stackshots;
  for (const std::string& entry : entriesOf(archive)) {
    if (entry.ends_with(".stackshot")) stackshots.push_back(entry);
  }
  ASSERT_THAT(stackshots, ElementsAre("Snapshots/" + name));
  EXPECT_THAT(textIn(archive, stackshots[0]),
              AllOf(HasSubstr("Reason:         ZalLogging Log Dump\nCode:           0xF33D1337\n"),
                    HasSubstr("[lirra-stackshot]")));
}

TEST_F(DumpE2eTest, AClientThatDiesMeanwhileLeavesTheArchive) {
  start();
  holdSecondStage();
  {
    lirra::Client client = makeClient();
    ask(client, "Vistel", 0x04);
    ASSERT_EQ(client.flush(60'000), LIRRA_OK);
  }
  releaseSecondStage();
  ASSERT_TRUE(eventually([&] {
    const auto all = records();
    return all.size() == 1 && all[0].record.state == State::done;
  }));
  EXPECT_THAT(entriesOf(records()[0].record.archivePath), Contains("Reason.txt"));
  lirra::Client other = makeClient();
  EXPECT_EQ(other.flush(60'000), LIRRA_OK);
}

TEST_F(DumpE2eTest, KilledInTheSecondStageItLosesNothingThatWasGathered) {
  start();
  lirra::Client client = makeClient();
  client.log("Vistel", "Default", "worth keeping");
  ASSERT_EQ(client.flush(60'000), LIRRA_OK);
  holdSecondStage();
  const std::uint64_t ticket = ask(client, "Vistel", 0x04);
  ASSERT_TRUE(
      eventually([&] { return output().find("Baseband not complete dumping") != std::string::npos; }));
  agent->signal(SIGKILL);
  ASSERT_EQ(agent->waitForExit(), -SIGKILL);
  lirra::Dictionary reply;
  EXPECT_EQ(client.awaitReply(ticket, kReplyLimit, reply), LIRRA_LOST);

  const auto logs = reportsEndingWith("/Vistel/Vistel.log");
  ASSERT_THAT(logs, SizeIs(1));
  EXPECT_THAT(readFile(logs[0]), HasSubstr("worth keeping"));
  ASSERT_THAT(records(), SizeIs(1));
  EXPECT_EQ(records()[0].record.state, State::cutOff);
  releaseSecondStage();
  start();
  lirra::Client next = makeClient();
  EXPECT_THAT(entriesOf(archiveOf(next, ask(next, "Messages", 0))), Contains("Reason.txt"));
  // The next agent finishes it before it takes requests, or meanwhile.
  ASSERT_TRUE(eventually([&] { return records().at(1).record.state == State::done; }));
  EXPECT_THAT(textIn(records()[1].record.archivePath, "Vistel/Vistel.log"), HasSubstr("worth keeping"));
}

TEST_F(DumpE2eTest, AnAnsweredPromptIsTheReasonAndAnAlertTellsTheEnd) {
  start();
  lirra::Client client = makeClient();
  const std::uint64_t ticket = ask(client, "Vistel", 0, 3);
  ASSERT_TRUE(eventually([&] { return alerts().size() == 1; }));
  EXPECT_EQ(alerts()[0].alert.message, "Please describe the problem briefly");
  EXPECT_EQ(alerts()[0].alert.title, "Vistel Logging");
  EXPECT_THAT(output(), HasSubstr("lirractl alerts answer " + alerts()[0].id));
  const std::string text = "picture froze \xC3\xBC $(touch X) `touch Y`";
  ASSERT_EQ(answerAlert(alertDirectory(sandbox / "runtime"), alerts()[0].id, "default", text), std::nullopt);
  const std::string archive = archiveOf(client, ticket);
  EXPECT_THAT(archive, EndsWith(") (picture froze \xC3\xBC $(to).zip"));
  EXPECT_EQ(textIn(archive, "Reason.txt"), text);
  ASSERT_TRUE(eventually([&] { return alerts().size() == 2; }));
  EXPECT_EQ(alerts()[1].alert.identifier, "CopyLogs");
  EXPECT_EQ(alerts()[1].alert.information.at("Path"), archive);
  EXPECT_TRUE(std::filesystem::exists(sandbox / "runtime/notifications/LirraLoggingDumpComplete"));
}

TEST_F(DumpE2eTest, ACancelledPromptIsNoDumpAndNoReply) {
  start();
  lirra::Client client = makeClient();
  const std::uint64_t ticket = ask(client, "Vistel", 0, 1);
  ASSERT_TRUE(eventually([&] { return alerts().size() == 1; }));
  ASSERT_EQ(answerAlert(alertDirectory(sandbox / "runtime"), alerts()[0].id, "alternate", std::nullopt),
            std::nullopt);
  ASSERT_TRUE(eventually([&] { return alerts()[0].state == AlertState::answered; }));
  // A later dump is answered, this one is not.
  EXPECT_NE(archiveOf(client, ask(client, "Messages", 0)), "");
  lirra::Dictionary reply;
  EXPECT_EQ(client.awaitReply(ticket, 0, reply), LIRRA_TIMEOUT);
  EXPECT_THAT(records(), SizeIs(1));
}

TEST_F(DumpE2eTest, AnIdleAgentLeavesAPromptBehindThatSaysItWasCutOff) {
  sandbox.settings = "[testing]\ninactivityLimit = 0.2\n";
  start();
  lirra::Client client = makeClient();
  ask(client, "Vistel", 0, 1);
  ASSERT_EQ(agent->waitForExit(), 0);
  ASSERT_THAT(alerts(), SizeIs(1));
  EXPECT_EQ(alerts()[0].state, AlertState::cutOff);
}

TEST_F(DumpE2eTest, HostileTextsRunNothingAndLeaveNoRoot) {
  start();
  lirra::Client client = makeClient();
  for (const std::string type :
       {"$(touch INJECTED)", "`touch INJECTED`", "a\"; touch INJECTED; \"", "-rf", "a\nb"}) {
    const std::string archive = archiveOf(client, ask(client, type, 0x1F));
    EXPECT_THAT(archive, ::testing::StartsWith(sandbox.reportRoot() + "/")) << type;
    EXPECT_THAT(entriesOf(archive), Contains("Reason.txt")) << type;
    EXPECT_EQ(textIn(archive, "Reason.txt"), type);
  }
  for (const std::string type : {"../..", "../../escaped", "../../../../../../tmp"}) {
    EXPECT_EQ(archiveOf(client, ask(client, type, 0x1F)), "") << type;
  }
  EXPECT_THAT(reportsEndingWith("INJECTED"), IsEmpty());
  EXPECT_THAT(testing::listTree(sandbox / "home"), Not(HasSubstr("INJECTED")));
  EXPECT_FALSE(std::filesystem::exists("INJECTED"));
}

TEST_F(DumpE2eTest, WithoutAReplyAskedForNoneComesAndTheDumpIsTheSame) {
  start();
  lirra::Client client = makeClient();
  lirra::Dictionary info;
  info.setInt64("displayFlags", kNoPromptNoAlert);
  ASSERT_EQ(client.action("Vistel", 14, info), LIRRA_OK);
  ASSERT_TRUE(eventually([&] {
    const auto all = records();
    return all.size() == 1 && all[0].record.state == State::done;
  }));
  EXPECT_THAT(entriesOf(records()[0].record.archivePath), Contains("Reason.txt"));
}

}  // namespace
}  // namespace zal
