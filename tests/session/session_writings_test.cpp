#include "session/session_writings.h"

#include <gmock/gmock.h>

#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

using ::testing::HasSubstr;

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

TEST_F(SessionWritingsTest, AFileOfAnotherFileSystemDoesNotHoldTheMainThreadAndWhatFollowsWaitsForIt) {
  runSession();
  EXPECT_THAT(verboseLog(), HasSubstr("End Session"));
  EXPECT_TRUE(std::filesystem::exists(capture));
  EXPECT_FALSE(isRecordRemoved());
  EXPECT_EQ(collections.size(), 0U);
  fakes.queues.runAll();
  EXPECT_TRUE(isMoved());
  EXPECT_TRUE(isRecordRemoved());
  EXPECT_EQ(collections.size(), 1U);
}

TEST_F(SessionWritingsTest, AFileOfTheSameOneIsInItsPlaceAtOnce) {
  fakes.files.isElsewhere = {};
  runSession();
  EXPECT_TRUE(isMoved());
  EXPECT_TRUE(isRecordRemoved());
  EXPECT_EQ(collections.size(), 1U);
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
