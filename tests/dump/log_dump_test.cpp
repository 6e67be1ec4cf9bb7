#include "dump/log_dump.h"

#include <gmock/gmock.h>

#include <filesystem>

#include "dump/dump_reply.h"
#include "tests/dump/action_fixture.h"

namespace zal {
namespace {

using namespace std::string_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

/// Dumps whose description is known already.
class LogDumpTest : public testing::ActionFixture {
 protected:
  [[nodiscard]] DumpRequest request(const std::string& type = "Vistel") const {
    DumpRequest request;
    request.sessionType = type;
    request.dumpTimeText = kTime;
    request.replyToken = kToken;
    request.peer = peer;
    request.bugReportComponent = "Calls";
    request.bugReportComponentVersion = "2.5";
    return request;
  }
  void run(const DumpRequest& what, const std::optional<std::string>& description) {
    logDump.run(what, description, server);
  }
  [[nodiscard]] std::string directory(const std::string& ending = "") const {
    return root + "/Vistel/Vistel-Log (" + kTime + ")" + ending;
  }
  void putLogSets() {
    for (const char* set : {"Vistel", "vistel", "GameRoom", "gameRoom", "Nexa", "NexaIDQuery", "Registration",
                            "Transport", "Plinth", "Messages"}) {
      testing::writeFile(fake.configuration.roots.UserLogRoot + "/" + set + "/" + set + ".log", set);
    }
  }
  /// The log sets that a dump of the type holds before it is archived.
  std::vector<std::string> logSetsOf(const std::string& type) {
    run(request(type), std::nullopt);
    std::vector<std::string> sets;
    for (const auto& entry :
         std::filesystem::directory_iterator(root + "/" + type + "/" + type + "-Log (" + kTime + ")")) {
      const std::string name = entry.path().filename().string();
      if (std::filesystem::exists(entry.path() / (name + ".log"))) sets.push_back(name);
    }
    return sets;
  }
};

TEST_F(LogDumpTest, ADescriptionIsKeptWholeAndTheDeviceDescribed) {
  fake.deviceSupport.name = "Kim's phone";
  fake.deviceRegistry.bytes = "Model7,1\0"s;
  run(request(), "1234567890123456789012345");
  const std::string made = directory(" (12345678901234567890)");
  EXPECT_EQ(testing::readFile(made + "/Reason.txt"), "1234567890123456789012345");
  EXPECT_EQ(testing::readFile(made + "/Device_Info.txt"), "Name: Kim's phone   Device: Model7,1   ");
}

TEST_F(LogDumpTest, WithoutADeviceThereIsAnEmptyFile) {
  run(request(), std::nullopt);
  EXPECT_TRUE(std::filesystem::exists(directory("/Device_Info.txt")));
  EXPECT_EQ(testing::readFile(directory("/Device_Info.txt")), "");
}

TEST_F(LogDumpTest, ADescriptionOfOnlySpacesCountsAsNone) {
  fake.telephony.reachable = true;
  DumpRequest withBaseband = request();
  withBaseband.collectionFlags = kCollectBaseband;
  run(withBaseband, "   ");
  EXPECT_EQ(testing::listTree(directory()),
            "Baseband Logs/\nDevice_Info.txt\nLocalPreview/\nPower/\nPush Logs/\nSnapshots/\n");
  // The collection was given no reason.
  EXPECT_THAT(fake.telephony.basebandDumps, ElementsAre("Baseband dump for Vistel logging"));
}

TEST_F(LogDumpTest, TheCollectionIsGivenTheUntrimmedDescriptionAsItsReason) {
  fake.telephony.reachable = true;
  DumpRequest withBaseband = request();
  withBaseband.collectionFlags = kCollectBaseband;
  run(withBaseband, " no sound ");
  EXPECT_THAT(fake.telephony.basebandDumps, ElementsAre(" no sound "));
  EXPECT_EQ(testing::readFile(directory(" ( no sound )/Reason.txt")), " no sound ");
}

TEST_F(LogDumpTest, VideoCallTypesInAnyCaseAndGamesTakeAllLogSetsOfTheStack) {
  putLogSets();
  using ::testing::UnorderedElementsAre;
  EXPECT_THAT(logSetsOf("vistel"),
              UnorderedElementsAre("vistel", "Nexa", "NexaIDQuery", "Registration", "Transport", "Plinth"));
  EXPECT_THAT(logSetsOf("GameRoom"),
              UnorderedElementsAre("GameRoom", "Nexa", "NexaIDQuery", "Registration", "Transport", "Plinth"));
  EXPECT_THAT(logSetsOf("gameRoom"), UnorderedElementsAre("gameRoom"));
}

TEST_F(LogDumpTest, TheLogSetsAreThereBeforeTheCollectionBegins) {
  putLogSets();
  run(request("Registration"), std::nullopt);
  EXPECT_EQ(fake.dumpProgress.lines.front(),
            "BEGIN Registration " + root + "/Registration/Registration-Log (" + kTime + ")");
  EXPECT_EQ(testing::readFile(root + "/Registration/Registration-Log (" + kTime +
                              ")/Registration/Registration.log"),
            "Registration");
}

TEST_F(LogDumpTest, TheAlertComesFirstThenTheNotificationTheReportAndTheReply) {
  DumpRequest everything = request();
  everything.showCompletionAlert = true;
  everything.fileReport = true;
  std::vector<std::string> seen;
  const auto state = [this] {
    return std::to_string(fake.userAlerts.posted.size()) +
           std::to_string(fake.systemNotifications.posts.size()) + std::to_string(reports.size()) +
           std::to_string(fakePeer->replies.size());
  };
  fake.systemNotifications.observe("LirraLoggingDumpComplete",
                                   [&] { seen.push_back("notified " + state()); });
  onReport = [&] { seen.push_back("reported " + state()); };
  run(everything, "no sound");
  EXPECT_EQ(state(), "0000");
  finish();
  EXPECT_THAT(seen, ElementsAre("notified 1100", "reported 1110"));
  EXPECT_EQ(state(), "1111");
  EXPECT_THAT(fake.systemNotifications.posts, ElementsAre("LirraLoggingDumpComplete"));
}

TEST_F(LogDumpTest, TheAlertNamesTheArchiveAndCarriesItsPath) {
  DumpRequest shown = request();
  shown.showCompletionAlert = true;
  run(shown, "no sound");
  finish();
  const std::string archive = directory(" (no sound).zip");
  EXPECT_THAT(alertTexts(),
              ElementsAre(std::string("CopyLogs | Vistel Logging | Logs have been successfully captured and "
                                      "stored in this file: Vistel-Log (") +
                          kTime + ") (no sound).zip"));
  const UserAlert& alert = fake.userAlerts.posted[0].alert;
  EXPECT_EQ(alert.defaultButton, "OK");
  EXPECT_EQ(alert.alternateButton, std::nullopt);
  EXPECT_EQ(alert.otherButton, std::nullopt);
  EXPECT_THAT(alert.information, ElementsAre(std::pair("Path"s, archive)));
  EXPECT_EQ(testing::readFile(archive), "archive of " + directory(" (no sound)"));
  fake.userAlerts.answer(0, {AlertResponse::kDefaultButton, {}});
  EXPECT_THAT(server.calls, ElementsAre("alert finished"));
}

TEST_F(LogDumpTest, TheAlertHasTheClientsTitle) {
  DumpRequest shown = request();
  shown.showCompletionAlert = true;
  shown.userInfo["title"] = "Video trouble";
  run(shown, std::nullopt);
  finish();
  EXPECT_EQ(alerts().at(0).title, "Video trouble");
}

TEST_F(LogDumpTest, WithoutTheAlertThereIsNoNotificationEitherButTheReply) {
  run(request(), "no sound");
  finish();
  EXPECT_THAT(alertTexts(), IsEmpty());
  EXPECT_THAT(fake.systemNotifications.posts, IsEmpty());
  EXPECT_THAT(reports, IsEmpty());
  EXPECT_THAT(fakePeer->replies, ElementsAre(std::pair(kToken, replyWithPath(directory(" (no sound).zip")))));
}

TEST_F(LogDumpTest, AReportHasTheDescriptionUnlessItSaysNothing) {
  DumpRequest filed = request();
  filed.fileReport = true;
  run(filed, " no sound ");
  finish();
  run(filed, "  ");
  finish();
  EXPECT_THAT(reports, ElementsAre(" no sound  | Calls | 2.5 | " + directory(" ( no sound ).zip"),
                                   "(none) | Calls | 2.5 | " + directory(".zip")));
}

TEST_F(LogDumpTest, TheReportHookDoesNothing) {
  EXPECT_EQ(FileReportHook("no sound", "Calls", "2.5", {"/archive.zip"}), 0);
}

TEST_F(LogDumpTest, AMessageThatExpectsNoReplyGetsTheSameDumpAndNone) {
  DumpRequest silent = request();
  silent.replyToken.reset();
  run(silent, std::nullopt);
  finish();
  EXPECT_TRUE(std::filesystem::exists(directory(".zip")));
  EXPECT_THAT(fakePeer->replies, IsEmpty());
}

TEST_F(LogDumpTest, APeerThatIsGoneGetsNoReplyAndTheDumpIsMade) {
  run(request(), std::nullopt);
  fakePeer->connected = false;
  finish();
  EXPECT_TRUE(std::filesystem::exists(directory(".zip")));
  EXPECT_THAT(fakePeer->replies, IsEmpty());
}

TEST_F(LogDumpTest, ARequestWithoutAPeerIsDumpedAllTheSame) {
  DumpRequest orphan = request();
  orphan.peer.reset();
  run(orphan, std::nullopt);
  finish();
  EXPECT_TRUE(std::filesystem::exists(directory(".zip")));
}

TEST_F(LogDumpTest, ADirectoryOutsideTheReportRootIsRefusedWithOneWarningAndAReplyWithoutAPath) {
  for (const std::string type : {"..", "../..", "../../../etc"}) {
    fake.agentLog.lines.clear();
    fakePeer->replies.clear();
    DumpRequest everything = request(type);
    everything.showCompletionAlert = true;
    everything.fileReport = true;
    const std::string before = testing::listTree(fake.home.path());
    run(everything, type);
    finish();
    EXPECT_EQ(testing::listTree(fake.home.path()), before);
    EXPECT_THAT(fake.agentLog.lines,
                ElementsAre("warning: Refused a dump of \"" + type +
                            "\": its directory would not lie below the report root, or only through a link"));
    EXPECT_THAT(fakePeer->replies, ElementsAre(std::pair(kToken, replyWithoutPath())));
  }
  EXPECT_THAT(fake.fileCopier.started, IsEmpty());
  EXPECT_THAT(alertTexts(), IsEmpty());
  EXPECT_THAT(fake.systemNotifications.posts, IsEmpty());
  EXPECT_THAT(reports, IsEmpty());
}

TEST_F(LogDumpTest, ARefusalShowsAtMostALineOfTheType) {
  run(request("../../" + std::string(4096, 'x') + "\nwarning: forged"), std::nullopt);
  run(request("..\n/../.."), std::nullopt);
  const std::string end = "\": its directory would not lie below the report root, or only through a link";
  EXPECT_THAT(warnings(), ElementsAre("warning: Refused a dump of \"../../" + std::string(94, 'x') + end,
                                      "warning: Refused a dump of \"..?/../.." + end));
}

TEST_F(LogDumpTest, NoHostileTextOfAClientLeavesTheRootOrRunsACommand) {
  const std::vector<std::string> texts = {"$(touch X)",    "`touch X`",    "\"; touch X; \"",
                                          "'; touch X; '", "a\ntouch X",   "-rf",
                                          "../x",          "../../etc",    "/etc/passwd",
                                          "a\0b"s,         "\xEF\xBF\xBD", std::string(4096, 'a'),
                                          "~/x",           "a/../../b",    "\\",
                                          "%n%s"};
  for (const std::string& text : texts) {
    for (const auto& [type, description] : {std::pair(text, "no sound"s), std::pair("Vistel"s, text)}) {
      DumpRequest everything = request(type);
      everything.showCompletionAlert = true;
      everything.userInfo["title"] = text;
      everything.collectionFlags = kUsualCollection;
      run(everything, description);
    }
  }
  finish();
  EXPECT_THAT(fakePeer->replies, SizeIs(2 * texts.size()));
  for (const auto& started : fake.fileCopier.started) {
    EXPECT_TRUE(started.input.starts_with(root + "/")) << started.input;
    EXPECT_EQ(started.input.find('\n'), std::string::npos);
    EXPECT_EQ(started.input.find('\0'), std::string::npos);
  }
  for (const auto& entry : std::filesystem::directory_iterator(fake.home.path())) {
    const std::string name = entry.path().filename().string();
    // Below the home there are the roots, and archives that found their place taken.
    EXPECT_TRUE(name == "Logs" || name == "tmp" || name.starts_with("temporary-")) << name;
  }
  for (const std::string& command : fake.shell.commands) {
    EXPECT_EQ(command.find('\n'), std::string::npos) << command;
  }
  for (const std::string& line : fake.agentLog.lines) EXPECT_EQ(line.find('\n'), std::string::npos) << line;
}

TEST_F(LogDumpTest, EveryDumpOfManyIsAnsweredOnce) {
  for (int number = 0; number < 5; ++number) {
    DumpRequest one = request();
    one.replyToken = kToken + static_cast<std::uint64_t>(number);
    run(one, "number " + std::to_string(number));
  }
  finish();
  ASSERT_THAT(fakePeer->replies, SizeIs(5));
  for (std::size_t number = 0; number < 5; ++number) {
    EXPECT_EQ(fakePeer->replies[number].first, kToken + number);
    EXPECT_EQ(fakePeer->replies[number].second,
              replyWithPath(directory(" (number " + std::to_string(number) + ").zip")));
  }
}

TEST_F(LogDumpTest, AnArchiveThatCannotBeMadeIsAnsweredToo) {
  fake.fileCopier.writesArchives = false;
  run(request(), std::nullopt);
  finish();
  EXPECT_THAT(fakePeer->replies, SizeIs(1));
}

TEST_F(LogDumpTest, ADirectoryThatCannotBeMadeIsAnsweredToo) {
  testing::writeFile(root + "/Vistel", "a file in the way");
  run(request(), "no sound");
  finish();
  EXPECT_EQ(testing::readFile(root + "/Vistel"), "a file in the way");
  EXPECT_THAT(fakePeer->replies, SizeIs(1));
}

}  // namespace
}  // namespace zal
