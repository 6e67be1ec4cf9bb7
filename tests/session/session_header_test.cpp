#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

class SessionHeaderTest : public SessionFixture {
 protected:
  /// Runs a session and gives the header lines of its simple log.
  std::string header() {
    session->beginSessionWithSender("caller");
    noteCheckpoints(2);
    session->endSessionWithSender("caller");
    const std::string file = simpleLog();
    return file.substr(0, file.find("[Sender: "));
  }
  void provideSystem() {
    fakes.systemVersion.values = {
        {{"ProductBuildVersion", "1A234"}, {"ProductVersion", "1.2"}, {"ProductName", "Phone System"}}};
  }
};

TEST_F(SessionHeaderTest, SkipsEveryLineWithoutAValue) {
  session->setRecipient("");
  EXPECT_EQ(header(), "[Time: Separator]\n[Reference Time: Unknown reference time!]\n");
}

TEST_F(SessionHeaderTest, SkipsAReferenceTimeThatIsNoText) {
  fakes.shell.respond = [this](const std::string&) {
    writeFile(fakes.configuration.roots.TemporaryRoot + "/time-file.txt", "\xFF");
    return 0;
  };
  EXPECT_EQ(header(), "[Time: Separator]\n");
}

TEST_F(SessionHeaderTest, ADeviceThatWasMissingAtTheFirstFillStaysMissing) {
  provideSystem();
  const std::string withoutDevice = R"([Time: Separator]
[Reference Time: Unknown reference time!]
[Build Version: 1A234]
[Product Version: 1.2]
[Product Name: Phone System]
)";
  EXPECT_EQ(header(), withoutDevice);
  fakes.deviceRegistry.bytes = "Phone1,1";
  EXPECT_EQ(header(), withoutDevice);
  session = makeSession();
  EXPECT_EQ(header(), withoutDevice);
  EXPECT_EQ(session->model(), "Phone1,1");
}

TEST_F(SessionHeaderTest, ReadsAnUnreadableSystemVersionAgainAtTheNextWrite) {
  fakes.deviceRegistry.bytes = "Phone1,1";
  EXPECT_EQ(header(), "[Time: Separator]\n[Reference Time: Unknown reference time!]\n[Device: Phone1,1]\n");
  provideSystem();
  EXPECT_EQ(header(), R"([Time: Separator]
[Reference Time: Unknown reference time!]
[Build Version: 1A234]
[Device: Phone1,1]
[Product Version: 1.2]
[Product Name: Phone System]
)");
  EXPECT_EQ(header(), header());
  EXPECT_EQ(fakes.systemVersion.reads, 2);
}

TEST_F(SessionHeaderTest, ALaterSessionOfTheObjectWritesWhatTheFirstOneKnew) {
  session->logCallInfo("video", "Kind", "caller");
  session->setInitiator("alice");
  session->endSessionWithSender("ENDALL");
  session->logCallInfo("audio", "Kind", "caller");
  EXPECT_EQ(header(), R"([Time: Separator]
[Reference Time: Unknown reference time!]
[Kind: video]
[Kind: audio]
[Initiator ID: alice]
)");
}

TEST_F(SessionHeaderTest, HeaderLinesAreEchoedUnderEitherSwitch) {
  const std::vector<std::string> echoed{"notice: === [Time: Separator]",
                                        "notice: === [Reference Time: Unknown reference time!]"};
  session->beginSessionWithSender("caller");
  noteCheckpoints(2);
  session->setLogDescriptionsToConsole(true);
  session->endSessionWithSender("caller");
  EXPECT_EQ(fakes.agentLog.lines, echoed);
}

TEST_F(SessionHeaderTest, AsksForTheModelUntilItHasOne) {
  EXPECT_EQ(session->model(), std::nullopt);
  fakes.deviceRegistry.bytes = std::string("Phone1,1\0trailing", 17);
  EXPECT_EQ(session->model(), "Phone1,1");
  fakes.deviceRegistry.bytes = "Other";
  EXPECT_EQ(session->model(), "Phone1,1");
  EXPECT_EQ(fakes.deviceRegistry.reads, 2);
}

TEST_F(SessionHeaderTest, AModelThatIsNoTextIsNone) {
  fakes.deviceRegistry.bytes = "\xFF";
  EXPECT_EQ(session->model(), std::nullopt);
}

}  // namespace
}  // namespace zal::testing
