#include "session/session_writings.h"

#include <gmock/gmock.h>

#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

using ::testing::AnyOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

/// A session with a file to collect, which lies on another file system.
class SessionWritingsTest : public SessionFixture {
 protected:
  SessionWritingsTest() {
    fakes.files.isElsewhere = [this](const std::string& source) { return source == capture; };
    services.sessionRecords = &fakes.sessionRecords;
    services.writings = &writings;
    session = makeSession();
    writeFile(capture, "captured");
  }
  ~SessionWritingsTest() override { session.reset(); }
  void runSession() {
    session->beginSessionWithSender("caller");
    session->addLogFile(capture, "caller", "");
    noteCheckpoints(3);
    session->endSessionWithSender("caller");
  }
  [[nodiscard]] bool isMoved() const {
    return std::filesystem::exists(receiverDirectory + "/capture") && !std::filesystem::exists(capture);
  }
  [[nodiscard]] bool isRecordRemoved() const { return fakes.sessionRecords.records.at(0)->isRemoved; }

  SessionWritings writings{fakes.host, fakes.queues};
  const std::string capture = fakes.home / "capture";
};

TEST_F(SessionWritingsTest, WhoAsksForTheReferenceTimeIsNotTheMainThread) {
  fakes.files.isElsewhere = {};
  runSession();
  EXPECT_THAT(fakes.shell.commands, IsEmpty());
  EXPECT_EQ(verboseLog(), "");
  fakes.shell.respond = [this](const std::string&) {
    writeFile(fakes.configuration.roots.TemporaryRoot + "/time-file.txt", "in time\n");
    return 0;
  };
  fakes.queues.runAll();
  EXPECT_THAT(fakes.shell.commands, ElementsAre(HasSubstr("getReferenceTime")));
  EXPECT_THAT(verboseLog(), StartsWith("[Time: Separator]\n[Reference Time: in time]\n"));
}

TEST_F(SessionWritingsTest, WhatIsAddedMeanwhileBelongsToTheNextSessionOfTheObject) {
  fakes.files.isElsewhere = {};
  session->setRecipient("bob");
  runSession();
  session->setRecipient("eve");
  session->logCallInfo("video", "Kind", "caller");
  session->noteCheckpoint("Later", kNow, "caller");
  fakes.queues.runAll();
  EXPECT_THAT(verboseLog(), HasSubstr("[Recipient ID: bob]"));
  EXPECT_THAT(verboseLog(), Not(AnyOf(HasSubstr("eve"), HasSubstr("video"), HasSubstr("Later"))));
}

TEST_F(SessionWritingsTest, TheEndOfAllSessionsIsOverWhenItReturns) {
  session->beginSessionWithSender("caller");
  session->addLogFile(capture, "caller", "");
  noteCheckpoints(3);
  session->endSessionWithSender("ENDALL");
  EXPECT_THAT(verboseLog(), HasSubstr("End Session"));
  EXPECT_TRUE(isMoved());
  ASSERT_EQ(collections.size(), 1U);
  EXPECT_FALSE(collections[0].background);
}

TEST_F(SessionWritingsTest, AnythingIsKeptUntilAllThatWereBegunAreFinished) {
  const auto kept = std::make_shared<int>();
  const std::weak_ptr<int> alive = kept;
  runSession();
  EXPECT_EQ(writings.begun(), 1U);
  writings.keepUntilFinished(kept);
  // The logs, the file from another file system, the record.
  for (int step = 0; step < 3; ++step) {
    EXPECT_EQ(kept.use_count(), 2) << step;
    ASSERT_TRUE(fakes.queues.runNext("session.logs"));
    fakes.host.drain();
  }
  EXPECT_EQ(kept.use_count(), 1);
  writings.keepUntilFinished(kept);  // there are none
  EXPECT_EQ(kept.use_count(), 1);
}

TEST_F(SessionWritingsTest, AFileOfAnotherFileSystemDoesNotHoldTheMainThreadAndWhatFollowsWaitsForIt) {
  runSession();
  ASSERT_TRUE(fakes.queues.runNext("session.logs"));
  fakes.host.drain();
  EXPECT_THAT(verboseLog(), HasSubstr("End Session"));
  EXPECT_TRUE(std::filesystem::exists(capture));
  EXPECT_FALSE(isRecordRemoved());
  EXPECT_EQ(collections.size(), 0U);
  fakes.queues.runAll();
  EXPECT_TRUE(isMoved());
  EXPECT_TRUE(isRecordRemoved());
  EXPECT_EQ(collections.size(), 1U);
}

TEST_F(SessionWritingsTest, AFileOfTheSameOneIsInItsPlaceWithTheLogs) {
  fakes.files.isElsewhere = {};
  runSession();
  ASSERT_TRUE(fakes.queues.runNext("session.logs"));
  fakes.host.drain();
  EXPECT_TRUE(isMoved());
}

TEST_F(SessionWritingsTest, TheRecordGoesAwayFromTheMainThreadAndBeforeTheCollection) {
  fakes.files.isElsewhere = {};
  runSession();
  ASSERT_TRUE(fakes.queues.runNext("session.logs"));
  fakes.host.drain();
  EXPECT_FALSE(isRecordRemoved());
  ASSERT_TRUE(fakes.queues.runNext("session.logs"));
  EXPECT_TRUE(isRecordRemoved());
  EXPECT_EQ(collections.size(), 0U);
  fakes.host.drain();
  EXPECT_EQ(collections.size(), 1U);
  EXPECT_EQ(fakes.queues.readyJobs("session.logs"), 0U);
}

TEST_F(SessionWritingsTest, TheEndOfTheProcessWaitsForIt) {
  runSession();
  writings.finishAll();
  EXPECT_TRUE(isMoved());
  EXPECT_TRUE(isRecordRemoved());
  EXPECT_EQ(collections.size(), 1U);
  fakes.queues.runAll();
  EXPECT_EQ(collections.size(), 1U);
}

TEST_F(SessionWritingsTest, ALargeSessionsLinesComeFirst) {
  session->beginSessionWithSender("caller");
  session->logDescription("Codec", std::string(5 << 20, 'c'), "media", kNow);
  session->addLogFile(capture, "caller", "");
  noteCheckpoints(3);
  session->endSessionWithSender("caller");
  writings.finishAll();
  EXPECT_THAT(simpleLog(), HasSubstr("End Session"));
  EXPECT_TRUE(isMoved());
  EXPECT_TRUE(isRecordRemoved());
  EXPECT_EQ(collections.size(), 1U);
}

TEST_F(SessionWritingsTest, WhereNobodyWaitsItIsMovedAtOnce) {
  services.writings = nullptr;
  runSession();
  EXPECT_TRUE(isMoved());
  EXPECT_EQ(collections.size(), 1U);
}

}  // namespace
}  // namespace zal::testing
