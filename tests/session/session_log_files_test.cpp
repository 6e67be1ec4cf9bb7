#include <chrono>

#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;
using Lines = std::vector<std::string>;

class SessionLogFilesTest : public SessionFixture {
 protected:
  void runSession() {
    session->beginSessionWithSender("caller");
    noteCheckpoints(2);
    session->endSessionWithSender("caller");
  }
  std::string fileNamed(const std::string& name) {
    writeFile(fakes.home / name, name);
    return fakes.home / name;
  }
};

TEST_F(SessionLogFilesTest, WritesTheWholeOfACallInThreeFiles) {
  fakes.systemVersion.values = {
      {{"ProductBuildVersion", "1A234"}, {"ProductVersion", "1.2"}, {"ProductName", "Phone System"}}};
  fakes.deviceRegistry.bytes = std::string("Phone1,1\0", 9);
  fakes.shell.respond = [this](const std::string&) {
    writeFile(fakes.configuration.roots.TemporaryRoot + "/time-file.txt", "1714651387.5\n");
    return 0;
  };
  session->setIsInitiator(true);
  session->setInitiator("alice");
  session->setRecipient("bob");
  session->setFailureReason("network lost");
  session->beginSessionWithSender("caller");
  session->logCallInfo("video", "Kind", "caller");
  session->logCallInfo("", "", "caller");
  session->noteCheckpoint("Connected", kNow + 1, "caller");
  session->logDescription("Codec", "chosen", "media", kNow + 0.5);
  for (const double value : {2, 4, 4, 4, 5, 5, 7, 9}) session->logQualityMetric("rtt", value, "media");
  host.advance(2s);
  session->endSessionWithSender("caller");

  const std::string directory = base + "/2024-05-02 at 14-03-07 (CEST) (Initiator)";
  EXPECT_EQ(listTree(base), R"(2024-05-02 at 14-03-07 (CEST) (Initiator)/
2024-05-02 at 14-03-07 (CEST) (Initiator)/Log (14-03-07).log
2024-05-02 at 14-03-07 (CEST) (Initiator)/Quality Log (14-03-07).log
2024-05-02 at 14-03-07 (CEST) (Initiator)/Verbose Log (14-03-07).log
)");
  EXPECT_EQ(readFile(directory + "/Log (14-03-07).log"), R"([Time: Separator]
[Reference Time: 1714651387.5]
[Kind: video]
[No Description: No Info]
[Build Version: 1A234]
[Device: Phone1,1]
[Product Version: 1.2]
[Product Name: Phone System]
[Failure Reason: network lost]
[Recipient ID: bob]
[Initiator ID: alice]
[Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: caller] Connected   [14:03:08.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:03:09.251  (2024-05-02) (CEST)]
)");
  EXPECT_EQ(readFile(directory + "/Verbose Log (14-03-07).log"), R"([Time: Separator]
[Reference Time: 1714651387.5]
[Kind: video]
[No Description: No Info]
[Build Version: 1A234]
[Device: Phone1,1]
[Product Version: 1.2]
[Product Name: Phone System]
[Failure Reason: network lost]
[Recipient ID: bob]
[Initiator ID: alice]
[Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: media] Codec: chosen   [14:03:07.751  (2024-05-02) (CEST)]
[Sender: caller] Connected   [14:03:08.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:03:09.251  (2024-05-02) (CEST)]
)");
  EXPECT_EQ(readFile(directory + "/Quality Log (14-03-07).log"), R"([Initiator ID: alice]
[Recipient ID: bob]
[Failure Reason: network lost]
[Product Name: Phone System]
[Product Version: 1.2]
[Device: Phone1,1]
[Build Version: 1A234]
[No Description: No Info]
[Kind: video]
[Reference Time: 1714651387.5]
[Time: Separator]
[Sender: media] rtt: 2   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: media] rtt: 4   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: media] rtt: 4   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: media] rtt: 4   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: media] rtt: 5   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: media] rtt: 5   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: media] rtt: 7   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: media] rtt: 9   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:03:09.251  (2024-05-02) (CEST)]
========================================
  [rtt]
 Average: 5
     Min: 2
     Max: 9
  Median: 4.5
  StdDev: 2
)");
}

TEST_F(SessionLogFilesTest, ASessionOfThreeLinesIsNotWritten) {
  fakes.agentLog.enabledCategories = {"Logging"};
  session->beginSessionWithSender("caller");
  noteCheckpoints(1);
  session->endSessionWithSender("caller");
  EXPECT_EQ(fakes.agentLog.lines, Lines{"log:Logging: No logs to write, bailing"});
  EXPECT_FALSE(std::filesystem::exists(base));
  EXPECT_TRUE(collections.empty());
}

TEST_F(SessionLogFilesTest, SaysNothingOfTooFewLinesUnlessTheCategoryIsOn) {
  session->beginSessionWithSender("caller");
  session->endSessionWithSender("caller");
  EXPECT_EQ(fakes.agentLog.lines, Lines{});
}

TEST_F(SessionLogFilesTest, ASecondBeginReportsThatTheForcedEndLeftNothing) {
  fakes.agentLog.enabledCategories = {"Logging"};
  session->beginSessionWithSender("a");
  noteCheckpoints(2);
  session->beginSessionWithSender("b");
  EXPECT_EQ(fakes.agentLog.lines, Lines{"log:Logging: No logs to write, bailing"});
  EXPECT_EQ(collections.size(), 1U);
}

TEST_F(SessionLogFilesTest, LinesTooFewToBeWrittenAreCarriedIntoTheNextSession) {
  session->beginSessionWithSender("first");
  host.advance(1s);
  session->endSessionWithSender("first");
  host.advance(1s);
  session->beginSessionWithSender("second");
  host.advance(1s);
  session->endSessionWithSender("second");
  receiverDirectory = base + "/2024-05-02 at 14-03-09 (CEST) (Receiver)";
  EXPECT_EQ(readFile(receiverDirectory + "/Log (14-03-09).log"), R"([Time: Separator]
[Reference Time: Unknown reference time!]
[Sender: first] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: first] End Session  [14:03:08.251  (2024-05-02) (CEST)]
[Sender: second] Begin Session  [14:03:09.251  (2024-05-02) (CEST)]
[Sender: second] End Session  [14:03:10.251  (2024-05-02) (CEST)]
)");
  EXPECT_EQ(readFile(receiverDirectory + "/Quality Log (14-03-09).log"),
            R"([Reference Time: Unknown reference time!]
[Time: Separator]
[Sender: first] End Session  [14:03:08.251  (2024-05-02) (CEST)]
[Sender: second] End Session  [14:03:10.251  (2024-05-02) (CEST)]
)");
}

TEST_F(SessionLogFilesTest, OneQualitySampleIsEnoughForTheSessionToBeWritten) {
  session->beginSessionWithSender("caller");
  host.advance(5s);
  session->endSessionWithSender("caller");
  EXPECT_EQ(listTree(receiverDirectory),
            "Log (14-03-07).log\nQuality Log (14-03-07).log\nVerbose Log (14-03-07).log\n");
}

TEST_F(SessionLogFilesTest, NamesTheDirectoryByRoleAndTheFilesByTheStart) {
  for (const bool initiator : {true, false}) {
    session = makeSession();
    session->setIsInitiator(initiator);
    session->beginSessionWithSender("caller");
    noteCheckpoints(2);
    session->endSessionWithSender("caller");
  }
  EXPECT_EQ(listTree(base), R"(2024-05-02 at 14-03-07 (CEST) (Initiator)/
2024-05-02 at 14-03-07 (CEST) (Initiator)/Log (14-03-07).log
2024-05-02 at 14-03-07 (CEST) (Initiator)/Quality Log (14-03-07).log
2024-05-02 at 14-03-07 (CEST) (Initiator)/Verbose Log (14-03-07).log
2024-05-02 at 14-03-07 (CEST) (Receiver)/
2024-05-02 at 14-03-07 (CEST) (Receiver)/Log (14-03-07).log
2024-05-02 at 14-03-07 (CEST) (Receiver)/Quality Log (14-03-07).log
2024-05-02 at 14-03-07 (CEST) (Receiver)/Verbose Log (14-03-07).log
)");
}

TEST_F(SessionLogFilesTest, AWordBeyondAsciiRunsIntoTheNextLine) {
  session->logCallInfo("1", "café", "caller");  // "[café: 1]" has 9 units and 10 bytes
  noteCheckpoints(2);
  session->endSessionWithSender("caller");
  EXPECT_TRUE(simpleLog().starts_with(R"([Time: Separator]
[Reference Time: Unknown reference time!]
[café: 1][Sender: )"));
}

TEST_F(SessionLogFilesTest, TwoSessionsOfOneSecondOverwriteEachOther) {
  runSession();
  session = makeSession();
  session->beginSessionWithSender("other");
  session->noteCheckpoint("x", kNow + 1, "other");
  session->noteCheckpoint("y", kNow + 2, "other");
  host.advance(3s);
  session->endSessionWithSender("other");
  EXPECT_EQ(simpleLog(), R"([Time: Separator]
[Reference Time: Unknown reference time!]
[Sender: other] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: other] x   [14:03:08.251  (2024-05-02) (CEST)]
[Sender: other] y   [14:03:09.251  (2024-05-02) (CEST)]
[Sender: other] End Session  [14:03:10.251  (2024-05-02) (CEST)]
)");
}

TEST_F(SessionLogFilesTest, ANeverBegunSessionHasNothingToWrite) {
  fakes.agentLog.enabledCategories = {"Logging"};
  session->writeSessionLog(false);
  EXPECT_EQ(fakes.agentLog.lines, Lines{"log:Logging: No logs to write, bailing"});
  EXPECT_FALSE(std::filesystem::exists(base));
}

TEST_F(SessionLogFilesTest, EmptiesTheListsWhenItWrites) {
  fakes.agentLog.enabledCategories = {"Logging"};
  runSession();
  session->endSessionWithSender("caller");
  session->writeSessionLog(false);
  EXPECT_EQ(fakes.agentLog.lines, Lines{"log:Logging: No logs to write, bailing"});
  EXPECT_EQ(collections.size(), 1U);
}

TEST_F(SessionLogFilesTest, MakesItsDirectoriesOpenToEverybody) {
  runSession();
  for (const std::string& directory : {base, receiverDirectory}) {
    EXPECT_EQ(std::filesystem::status(directory).permissions(), std::filesystem::perms::all) << directory;
  }
}

TEST_F(SessionLogFilesTest, ExpandsTheHomeMarkOfItsDirectory) {
  session = std::make_shared<ZalLoggingAgentVistelSession>("Vistel", "~/Logs/Reports/Vistel", services);
  runSession();
  EXPECT_EQ(listTree(receiverDirectory),
            "Log (14-03-07).log\nQuality Log (14-03-07).log\nVerbose Log (14-03-07).log\n");
}

TEST_F(SessionLogFilesTest, LinksTheLogSetOfItsTypeBesideThem) {
  writeFile(fakes.configuration.roots.UserLogRoot + "/Vistel/Vistel.log", "records");
  runSession();
  EXPECT_EQ(readFile(receiverDirectory + "/Vistel/Vistel.log"), "records");
}

TEST_F(SessionLogFilesTest, PlacesCollectedFilesByCategory) {
  session->addLogFile(fileNamed("a.log"), "one", "Video");
  session->addLogFile(fileNamed("b.log"), "two", "Video");
  session->addLogFile(fileNamed("c.log"), "one", std::nullopt);
  session->addLogFile(fileNamed("d.log"), "one", "");
  session->addLogFile(std::nullopt, "one", "Nothing");
  runSession();
  EXPECT_EQ(listTree(receiverDirectory), R"(Collected Files/
Collected Files/c.log
Log (14-03-07).log
Quality Log (14-03-07).log
Verbose Log (14-03-07).log
Video/
Video/a.log
Video/b.log
d.log
)");
  EXPECT_EQ(fakes.agentLog.lines,
            (Lines{"notice: category:" + receiverDirectory + "/ files={" + (fakes.home / "d.log") + "}",
                   "notice: category:" + receiverDirectory + "/Collected Files files={" +
                       (fakes.home / "c.log") + "}",
                   "notice: category:" + receiverDirectory + "/Video files={" + (fakes.home / "a.log") +
                       ", " + (fakes.home / "b.log") + "}"}));
}

TEST_F(SessionLogFilesTest, KeepsAFileThatIsGivenTwiceOnce) {
  const std::string file = fileNamed("a.log");
  session->addLogFile(file, "one", "Video");
  session->addLogFile(file, "two", "Video");
  runSession();
  EXPECT_EQ(fakes.agentLog.lines,
            Lines{"notice: category:" + receiverDirectory + "/Video files={" + file + "}"});
}

TEST_F(SessionLogFilesTest, ALaterSessionCollectsTheSamePathsAgain) {
  const std::string file = fileNamed("a.log");
  session->addLogFile(file, "one", "Video");
  runSession();
  fileNamed("a.log");
  host.advance(1s);
  runSession();
  EXPECT_TRUE(std::filesystem::exists(base + "/2024-05-02 at 14-03-08 (CEST) (Receiver)/Video/a.log"));
}

TEST_F(SessionLogFilesTest, ACategoryThatLeadsOutIsRefusedAndTheRestGoesOn) {
  session->addLogFile(fileNamed("a.log"), "one", "../../escaped");
  session->addLogFile(fileNamed("b.log"), "one", "Video");
  session->setFailureReason("reason");
  runSession();
  EXPECT_EQ(fakes.agentLog.lines.front(),
            "warning: Refused the file category \"../../escaped\": it leads out of the session directory");
  EXPECT_TRUE(std::filesystem::exists(fakes.home / "a.log"));
  EXPECT_TRUE(std::filesystem::exists(receiverDirectory + "/Video/b.log"));
  EXPECT_EQ(collections.size(), 1U);
}

TEST_F(SessionLogFilesTest, HandsTheDirectoryToTheCollection) {
  session->setFailureReason("network lost");
  session->setEndFlags(0x5F);
  runSession();
  EXPECT_EQ(
      collections,
      (std::vector<CollectionRequest>{{"Vistel", receiverDirectory, "Vistel - network lost", true, 0x5F}}));
}

TEST_F(SessionLogFilesTest, HandsOverNoReasonWithoutAFailure) {
  session->setFailureReason("");
  session->beginSessionWithSender("caller");
  noteCheckpoints(2);
  session->endSessionWithSender("ENDALL");
  EXPECT_EQ(collections,
            (std::vector<CollectionRequest>{{"Vistel", receiverDirectory, std::nullopt, false, 0, true}}));
}

TEST_F(SessionLogFilesTest, TheFilesAreThereWhenTheCollectionStarts) {
  session->addLogFile(fileNamed("a.log"), "one", "");
  std::string seen;
  services.CollectServiceLogs = [&](const CollectionRequest& request) {
    seen = listTree(request.destination);
  };
  runSession();
  EXPECT_EQ(seen, "Log (14-03-07).log\nQuality Log (14-03-07).log\nVerbose Log (14-03-07).log\na.log\n");
}

TEST_F(SessionLogFilesTest, ADirectoryThatCannotBeMadeCostsOneWarningForEachFileAndNothingElse) {
  writeFile(base, "a file where the directory belongs");
  runSession();
  EXPECT_EQ(
      fakes.agentLog.lines,
      (Lines{
          "warning: Could not write " + receiverDirectory + "/Log (14-03-07).log: Not a directory",
          "warning: Could not write " + receiverDirectory + "/Verbose Log (14-03-07).log: Not a directory",
          "warning: Could not write " + receiverDirectory + "/Quality Log (14-03-07).log: Not a directory"}));
  EXPECT_EQ(collections.size(), 1U);
}

TEST_F(SessionLogFilesTest, ATypeWithControlCharactersIsRefused) {
  base = fakes.home / "Logs/Reports/Vis\ntel";
  session = std::make_shared<ZalLoggingAgentVistelSession>("Vis\ntel", base, services);
  runSession();
  EXPECT_EQ(fakes.agentLog.lines,
            Lines{"warning: Refused to write into \"" + (fakes.home / "Logs/Reports/Vis?tel") +
                  "\": its name holds control characters"});
  EXPECT_FALSE(std::filesystem::exists(base));
}

TEST_F(SessionLogFilesTest, GivesPathsAndNamesOfMoments) {
  const WallTime moment = wallTimeFromSeconds(kNow);
  EXPECT_EQ(ZalLoggingAgentVistelSession::logStringForDate(services, moment),
            "2024-05-02 at 14-03-07 (CEST)");
  EXPECT_EQ(ZalLoggingAgentVistelSession::logPathForDate(services, moment, "~/x/../Vistel", false),
            fakes.home / "Vistel/2024-05-02 at 14-03-07 (CEST) (Receiver)");
  std::filesystem::create_directory(fakes.home / "real");
  std::filesystem::create_symlink(fakes.home / "real", fakes.home / "link");
  EXPECT_EQ(ZalLoggingAgentVistelSession::logPathForDate(services, moment, fakes.home / "link", true),
            fakes.home / "real/2024-05-02 at 14-03-07 (CEST) (Initiator)");
}

TEST_F(SessionLogFilesTest, AZoneWithoutANameIsUnknown) {
  host.zone = "";
  EXPECT_EQ(ZalLoggingAgentVistelSession::logStringForDate(services, wallTimeFromSeconds(kNow)),
            "2024-05-02 at 14-03-07 (Unknown)");
}

}  // namespace
}  // namespace zal::testing
