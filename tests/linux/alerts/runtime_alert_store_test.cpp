#include "platform/linux/alerts/runtime_alert_store.h"

#include <sys/stat.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <set>
#include <sstream>
#include <thread>

#include "tests/linux/alerts/alert_store_fixture.h"
#include "tests/support/file_size_limit.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

class RuntimeAlertStoreTest : public testing::AlertStoreFixture {};

TEST_F(RuntimeAlertStoreTest, NothingIsMadeBeforeTheFirstAlert) {
  settle();
  EXPECT_EQ(testing::listTree(root.path()), "");
}

TEST_F(RuntimeAlertStoreTest, AnAlertIsARecordThatWaitsAndIsAnnouncedInOneLine) {
  post(question("Vistel\nLogging"));
  EXPECT_THAT(listAlerts(directory), IsEmpty());
  settle();
  EXPECT_EQ(testing::listTree(root.path()), "run/\nrun/alerts/\nrun/alerts/1.toml\n");
  EXPECT_THAT(log.lines,
              ElementsAre("notice: Alert 1: Vistel\\x0aLogging: Please describe the problem briefly "
                          "(to answer: lirractl alerts answer 1)"));
  const auto records = listAlerts(directory);
  ASSERT_THAT(records, SizeIs(1));
  EXPECT_EQ(records[0].id, "1");
  EXPECT_EQ(records[0].state, AlertState::waiting);
  EXPECT_EQ(records[0].alert.identifier, "kind");
  EXPECT_EQ(records[0].alert.title, "Vistel\nLogging");
  EXPECT_EQ(records[0].agent, ProcessIdentity::ofThisProcess());
  EXPECT_THAT(given, IsEmpty());
}

TEST_F(RuntimeAlertStoreTest, TheDirectoryAndTheRecordsAreForTheirOwnerAlone) {
  post(question());
  settle();
  struct stat status {};
  ASSERT_EQ(::stat(directory.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777U, 0700U);
  ASSERT_EQ(::stat((directory + "/1.toml").c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777U, 0600U);
}

TEST_F(RuntimeAlertStoreTest, AnAnswerReachesTheListenerOnceAndStaysInTheRecord) {
  post(question());
  settle();
  EXPECT_EQ(answer("1", "default", "no sound"), std::nullopt);
  runUntil([&] { return !given.empty(); });
  settle();
  EXPECT_THAT(given, ElementsAre(Given{AlertResponse::kDefaultButton, "no sound"}));
  EXPECT_EQ(testing::listTree(directory), "1.toml\n");
  const auto record = readAlert(directory, "1");
  ASSERT_TRUE(record && record->answer);
  EXPECT_EQ(record->state, AlertState::answered);
  EXPECT_EQ(record->answer->code, AlertResponse::kDefaultButton);
  EXPECT_EQ(record->answer->text, "no sound");
  EXPECT_EQ(answer("1", "default", "again"), "Alert 1 has been answered already.");
}

TEST_F(RuntimeAlertStoreTest, EachButtonHasItsNumberAndAFieldLeftAloneKeepsItsText) {
  UserAlert alert = question();
  alert.otherButton = "Later";
  for (int i = 0; i < 4; ++i) post(alert);
  settle();
  for (const char* const button : {"default", "alternate", "other", "cancel"}) {
    const std::size_t before = given.size();
    EXPECT_EQ(answer(std::to_string(before + 1), button), std::nullopt);
    runUntil([&] { return given.size() > before; });
  }
  EXPECT_THAT(given, ElementsAre(Given{0, "untouched"}, Given{1, "untouched"}, Given{2, "untouched"},
                                 Given{3, "untouched"}));
}

TEST_F(RuntimeAlertStoreTest, AnAlertWithoutATextFieldGivesNone) {
  post(notice());
  settle();
  EXPECT_EQ(answer("1", "default", "text"), "Alert 1 has no text field.");
  EXPECT_EQ(answer("1", "default"), std::nullopt);
  runUntil([&] { return !given.empty(); });
  EXPECT_THAT(given, ElementsAre(Given{0, Value()}));
}

TEST_F(RuntimeAlertStoreTest, TwoAlertsAtOnceAreAnsweredInAnyOrder) {
  std::vector<Given> first;
  std::vector<Given> second;
  store->post(question("first"), keep(first));
  store->post(question("second"), keep(second));
  settle();
  EXPECT_EQ(answer("2", "default", "two"), std::nullopt);
  runUntil([&] { return !second.empty(); });
  EXPECT_THAT(first, IsEmpty());
  EXPECT_EQ(answer("1", "cancel", "one"), std::nullopt);
  runUntil([&] { return !first.empty(); });
  EXPECT_THAT(first, ElementsAre(Given{3, "one"}));
  EXPECT_THAT(second, ElementsAre(Given{0, "two"}));
}

TEST_F(RuntimeAlertStoreTest, ANoticeWithoutAListenerWaitsUntilItIsAcknowledged) {
  store->post(notice(), nullptr);
  settle();
  EXPECT_EQ(states(), "1 waiting\n");
  EXPECT_EQ(answer("1", "default"), std::nullopt);
  runUntil([&] { return states() == "1 answered\n"; });
}

TEST_F(RuntimeAlertStoreTest, AListenerMayPostTheNextAlert) {
  store->post(question("first"), [this](const AlertResponse&) { post(question("second")); });
  settle();
  EXPECT_EQ(answer("1", "default"), std::nullopt);
  runUntil([&] { return states() == "1 answered\n2 waiting\n"; });
}

TEST_F(RuntimeAlertStoreTest, AnswersToNothingAreRefusedAtOnce) {
  post(question());
  settle();
  EXPECT_EQ(answer("2", "default"), "There is no alert 2.");
  for (const char* const id : {"", "0", "01", "-1", "1 ", "1.toml", "x", "1234567890"}) {
    EXPECT_EQ(answer(id, "default"), std::string("There is no alert ") + id + ".");
  }
  EXPECT_EQ(answer("../alerts/1\n", "default"), "There is no alert ../alerts/1\\x0a.");
  EXPECT_EQ(answer("1", "other"), "Alert 1 has no button \"other\".");
  EXPECT_EQ(answer("1", "OK"), "Alert 1 has no button \"OK\".");
  EXPECT_EQ(answer("1", "default", std::string(70'000, 'x')),
            "The text is too long: an answer has at most 65536 bytes.");
  EXPECT_EQ(testing::listTree(directory), "1.toml\n");
}

TEST_F(RuntimeAlertStoreTest, ASecondAnswerBeforeTheFirstIsTakenIsRefused) {
  post(question());
  settle();
  EXPECT_EQ(answer("1", "default", "first"), std::nullopt);
  EXPECT_EQ(answer("1", "cancel"), "Alert 1 has been answered a moment ago.");
  runUntil([&] { return !given.empty(); });
  EXPECT_THAT(given, ElementsAre(Given{0, "first"}));
}

TEST_F(RuntimeAlertStoreTest, HostileAnswersCostAWarningAndTheAlertStillWaits) {
  post(question());
  settle();
  log.lines.clear();
  drop("1.answer", "button = \"other\"\n");
  drop("7.answer", "button = \"default\"\n");
  drop("x\ny.answer", "button = \"default\"\n");
  drop("note.txt", "anything");
  runUntil([&] { return log.lines.size() == 3; });
  drop("1.answer", "]]] not toml");
  runUntil([&] { return log.lines.size() == 4; });
  drop("1.answer", "button = \"default\"\ntext = \"" + std::string(65'536, 'x') + "\"\n");
  runUntil([&] { return log.lines.size() == 5; });
  std::filesystem::create_directory(root / "folder");
  std::filesystem::rename(root / "folder", directory + "/1.answer");
  runUntil([&] { return log.lines.size() == 6; });
  ASSERT_EQ(::mkfifo((root / "pipe").c_str(), 0600), 0);
  std::filesystem::rename(root / "pipe", directory + "/1.answer");
  runUntil([&] { return log.lines.size() == 7; });
  ASSERT_THAT(log.lines[3], ::testing::StartsWith("warning: An answer to alert 1 was dropped: line 1: "));
  log.lines.erase(log.lines.begin() + 3);
  EXPECT_THAT(log.lines,
              ElementsAre("warning: An answer to alert 1 was dropped: the alert has no button \"other\"",
                          "warning: An answer to alert 7 was dropped: nothing waits for it",
                          "warning: An answer to alert x\\x0ay was dropped: there is no such alert",
                          "warning: An answer to alert 1 was dropped: File too large",
                          "warning: An answer to alert 1 was dropped: Is a directory",
                          "warning: An answer to alert 1 was dropped: Invalid argument"));
  EXPECT_EQ(testing::listTree(directory), "1.toml\nnote.txt\n");
  EXPECT_THAT(given, IsEmpty());
  EXPECT_EQ(answer("1", "default", "at last"), std::nullopt);
  runUntil([&] { return !given.empty(); });
  EXPECT_THAT(given, ElementsAre(Given{0, "at last"}));
}

TEST_F(RuntimeAlertStoreTest, AnAlertWithATimeRunsOutAsCancelled) {
  UserAlert alert = question();
  alert.timeout = 0.01;
  post(alert);
  runUntil([&] { return !given.empty(); });
  EXPECT_THAT(given, ElementsAre(Given{AlertResponse::kCancelled, "untouched"}));
  EXPECT_EQ(states(), "1 timed out\n");
  EXPECT_EQ(answer("1", "default"), "Alert 1 takes no answer any more: nobody answered in time.");
}

TEST_F(RuntimeAlertStoreTest, TimesThatAreNoneNeverRunOut) {
  for (const double timeout : {0.0, -1.0, std::nan(""), 1e300}) {
    UserAlert alert = question();
    alert.timeout = timeout;
    post(alert);
  }
  settle();
  EXPECT_EQ(states(), "1 waiting\n2 waiting\n3 waiting\n4 waiting\n");
}

TEST_F(RuntimeAlertStoreTest, AnAnswerInTimeStopsTheClock) {
  UserAlert alert = question();
  alert.timeout = 3600;
  post(alert);
  settle();
  EXPECT_EQ(answer("1", "alternate"), std::nullopt);
  runUntil([&] { return !given.empty(); });
  EXPECT_EQ(states(), "1 answered\n");
}

TEST_F(RuntimeAlertStoreTest, TheEndOfTheAgentIsInTheRecordsOfThoseThatWait) {
  post(question("answered"));
  post(question("waiting"));
  settle();
  EXPECT_EQ(answer("1", "default"), std::nullopt);
  runUntil([&] { return !given.empty(); });
  store->cutOffWaiting();
  settle();
  EXPECT_EQ(states(), "1 answered\n2 cut off\n");
  EXPECT_THAT(recordText("2"), ::testing::HasSubstr("state = \"cut off\"\n"));
  EXPECT_THAT(recordText("2"), ::testing::HasSubstr("reason = \"the agent ended before it was answered\"\n"));
  EXPECT_EQ(answer("2", "default"),
            "Alert 2 takes no answer any more: the agent ended before it was answered.");
  EXPECT_THAT(given, SizeIs(1));
}

TEST_F(RuntimeAlertStoreTest, RecordsOfAKilledAgentReadAsCutOffAndAreMarkedWithTheNextAlert) {
  const ProcessIdentity ended = endedProcess();
  leaveRecord("3", AlertState::waiting, ended);
  leaveRecord("4", AlertState::answered, ended);
  // The id was given out again since.
  leaveRecord("5", AlertState::waiting, {::getpid(), 1});
  testing::writeFile(directory + "/3.answer", "button = \"default\"\n");
  EXPECT_EQ(states(), "3 cut off\n4 answered\n5 cut off\n");
  EXPECT_EQ(answer("3", "default"),
            "Alert 3 takes no answer any more: the agent ended before it was answered.");
  EXPECT_THAT(recordText("3"), ::testing::HasSubstr("state = \"waiting\"\n"));
  post(question());
  settle();
  EXPECT_EQ(states(), "3 cut off\n4 answered\n5 cut off\n6 waiting\n");
  EXPECT_THAT(recordText("3"), ::testing::HasSubstr("state = \"cut off\"\n"));
  EXPECT_THAT(recordText("5"), ::testing::HasSubstr("state = \"cut off\"\n"));
  EXPECT_EQ(testing::listTree(directory), "3.toml\n4.toml\n5.toml\n6.toml\n");
}

TEST_F(RuntimeAlertStoreTest, NumbersGoOnAfterTheHighestOneAndGarbageIsNoRecord) {
  leaveRecord("41", AlertState::cutOff, endedProcess());
  testing::writeFile(directory + "/7.toml", "garbage");
  testing::writeFile(directory + "/notes.toml", "garbage");
  testing::writeFile(directory + "/.new-1-1", "half a reco");
  post(question());
  settle();
  EXPECT_EQ(states(), "41 cut off\n42 waiting\n");
}

TEST_F(RuntimeAlertStoreTest, TwoAgentsInOneDirectoryTakeDifferentNumbers) {
  auto other = makeStore();
  post(question("mine"));
  settle();
  other->post(question("theirs"), nullptr);
  settle();
  post(question("mine too"));
  settle();
  std::string titles;
  for (const AlertRecord& record : listAlerts(directory))
    titles += record.id + " " + record.alert.title + "\n";
  EXPECT_EQ(titles, "1 mine\n2 theirs\n3 mine too\n");
}

TEST_F(RuntimeAlertStoreTest, AnAnswerToAnotherRunningAgentIsLeftToIt) {
  const pid_t parent = ::getppid();
  std::ifstream stat("/proc/" + std::to_string(parent) + "/stat");
  std::string text{std::istreambuf_iterator<char>(stat), {}};
  std::istringstream fields(text.substr(text.rfind(')') + 1));
  std::string field;
  for (int i = 0; i < 20; ++i) fields >> field;
  leaveRecord("1", AlertState::waiting, {parent, std::stoull(field)});
  ASSERT_EQ(states(), "1 waiting\n");
  post(question());
  settle();
  log.lines.clear();
  EXPECT_EQ(answer("1", "default"), std::nullopt);
  EXPECT_EQ(answer("2", "default"), std::nullopt);
  runUntil([&] { return !given.empty(); });
  EXPECT_EQ(testing::listTree(directory), "1.answer\n1.toml\n2.toml\n");
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(RuntimeAlertStoreTest, FiftyRecordsThatAreOverAreKeptAndEveryOpenQuestion) {
  const ProcessIdentity ended = endedProcess();
  for (int i = 1; i <= 60; ++i) leaveRecord(std::to_string(i), AlertState::answered, ended);
  post(question());
  settle();
  EXPECT_EQ(listAlerts(directory).size(), 51U);
  EXPECT_EQ(listAlerts(directory).front().id, "11");
  for (int i = 0; i < 60; ++i) store->post(notice(), nullptr);
  settle();
  const auto records = listAlerts(directory);
  EXPECT_EQ(records.size(), 51U);
  EXPECT_EQ(records.front().id, "61");
  EXPECT_EQ(records[1].id, "72");
  EXPECT_EQ(records.back().id, "121");
  EXPECT_EQ(answer("61", "default"), std::nullopt);
  runUntil([&] { return !given.empty(); });
}

TEST_F(RuntimeAlertStoreTest, EndlessQuestionsAreDroppedBeforeTheyFillTheDirectory) {
  for (int i = 0; i < 1001; ++i) post(question("Q" + std::to_string(i)));
  settle();
  EXPECT_EQ(listAlerts(directory).size(), 1000U);
  EXPECT_EQ(log.lines.back(), "warning: Alert \"Q1000\" was dropped: 1000 others wait for an answer already");
  EXPECT_EQ(answer("5", "cancel"), std::nullopt);
  runUntil([&] { return !given.empty(); });
  post(question("again"));
  settle();
  EXPECT_EQ(listAlerts(directory).back().alert.title, "again");
}

TEST_F(RuntimeAlertStoreTest, WhereTheDirectoryCannotBeMadeThereIsOneWarningAndNoAnswer) {
  testing::writeFile(root / "run", "in the way");
  post(question());
  post(question());
  settle();
  EXPECT_THAT(log.lines, ElementsAre("warning: " + directory + ": cannot be made: Not a directory"));
  EXPECT_THAT(given, IsEmpty());
  std::filesystem::remove(root / "run");
  post(question());
  settle();
  EXPECT_EQ(states(), "1 waiting\n");
}

TEST_F(RuntimeAlertStoreTest, WhereARecordCannotBeWrittenOneWarningSaysWhichAlertNobodySees) {
  {
    const testing::FileSizeLimit full(0);
    post(question("first"));
    post(question("second"));
    settle();
  }
  EXPECT_THAT(log.lines,
              ElementsAre("warning: " + directory +
                          "/1.toml: cannot be written: File too large; nobody sees the alert \"first\""));
  EXPECT_EQ(testing::listTree(directory), "");
  post(question("third"));
  settle();
  EXPECT_THAT(listAlerts(directory), SizeIs(1));
  EXPECT_EQ(listAlerts(directory)[0].alert.title, "third");
}

TEST_F(RuntimeAlertStoreTest, AnAnswerIsTakenWhereTheRecordCannotTellOfIt) {
  post(question());
  settle();
  log.lines.clear();
  EXPECT_EQ(answer("1", "default", "heard"), std::nullopt);
  {
    const testing::FileSizeLimit full(0);
    runUntil([&] { return !given.empty(); });
  }
  EXPECT_THAT(given, ElementsAre(Given{0, "heard"}));
  EXPECT_THAT(log.lines, ElementsAre("warning: " + directory + "/1.toml: cannot be written: File too large"));
  EXPECT_EQ(testing::listTree(directory), "1.toml\n");
}

TEST_F(RuntimeAlertStoreTest, AnyThreadMayPost) {
  std::vector<std::thread> threads;
  for (int t = 0; t < 4; ++t) {
    threads.emplace_back([this, t] {
      for (int i = 0; i < 25; ++i) post(question(std::to_string(t * 25 + i)));
    });
  }
  runUntil([&] { return listAlerts(directory).size() == 100; });
  for (std::thread& thread : threads) thread.join();
  std::set<std::string> titles;
  for (const AlertRecord& record : listAlerts(directory)) titles.insert(record.alert.title);
  EXPECT_EQ(titles.size(), 100U);
  for (int i = 1; i <= 100; ++i) EXPECT_EQ(answer(std::to_string(i), "default"), std::nullopt);
  runUntil([&] { return given.size() == 100; });
}

TEST_F(RuntimeAlertStoreTest, AStoreMayGoWhilePostsAndAnswersAreOnTheirWay) {
  post(question());
  settle();
  EXPECT_EQ(answer("1", "default"), std::nullopt);
  post(question());
  store.reset();
  settle();
  EXPECT_THAT(given, IsEmpty());
}

TEST_F(RuntimeAlertStoreTest, ADirectoryThatIsRemovedComesBackWithTheNextAlert) {
  post(question());
  settle();
  std::filesystem::remove_all(root / "run");
  post(question());
  settle();
  EXPECT_EQ(states(), "2 waiting\n");
  EXPECT_EQ(answer("2", "default", "still heard"), std::nullopt);
  runUntil([&] { return !given.empty(); });
  EXPECT_THAT(given, ElementsAre(Given{0, "still heard"}));
}

}  // namespace
}  // namespace zal
