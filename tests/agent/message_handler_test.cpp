#include "agent/message_handler.h"

#include <gmock/gmock.h>

#include <limits>
#include <stdexcept>

#include "agent/request_table.h"
#include "tests/agent/agent_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using testing::FakeMessage;
using testing::FakePeer;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using Kept = testing::RecordingLogFacility::Kept;

/// Requests as peers send them, to a real server with real sessions.
class MessageHandlerTest : public testing::AgentFixture {
 protected:
  void SetUp() override {
    createLogging();
    server->start();
  }
  void send(const FakeMessage& message) { fake.ipc.onPeerEvent(peer, IpcEvent{&message}); }
  void send(std::int64_t code, ValueMap values = {}) {
    FakeMessage message;
    message.values = std::move(values);
    message.values["__ipc__event_code__"] = code;
    send(message);
  }
  void sendMetric(const std::string& name, std::optional<Number> number) {
    FakeMessage message{{"__ipc__event_code__", std::int64_t{6}},
                        {"description", name},
                        {"session", std::string("Vistel")},
                        {"sender", std::string("meter")}};
    if (number) message.codedNumbers["number"] = *number;
    send(message);
  }
  void sendError(IpcError error) { fake.ipc.onPeerEvent(peer, IpcEvent{error}); }
  /// The keys that a request of that code reads, after the event code itself.
  std::vector<std::string> keysRead(std::int64_t code) {
    FakeMessage message{{"__ipc__event_code__", code}};
    send(message);
    EXPECT_EQ(message.readKeys.front(), "__ipc__event_code__");
    return {message.readKeys.begin() + 1, message.readKeys.end()};
  }
  static Value text(const char* value) { return std::string(value); }
  void beginVistel(std::int64_t flags = 0) {
    send(0, {{"sessionType", text("Vistel")}, {"sender", text("caller")}, {"beginSessionFlags", flags}});
  }
  void endVistel() {
    send(1, {{"sessionType", text("Vistel")}, {"sender", text("caller")}});
    advance(3s);
    writeSessions();
  }
  [[nodiscard]] std::string vistelFile(const std::string& name) {
    return report("Vistel/2024-05-02 at 14-03-07 (CEST) (Receiver)/" + name + " (14-03-07).log");
  }

  std::shared_ptr<FakePeer> peer = std::make_shared<FakePeer>(4711);
};

TEST_F(MessageHandlerTest, HasARowForEachOfTheCodes0To16) { EXPECT_EQ(requestTable().size(), 17U); }

TEST_F(MessageHandlerTest, ReadsTheKeysOfEachRequestInOrder) {
  EXPECT_THAT(keysRead(0), ElementsAre("sessionType", "sender", "beginSessionFlags", "endSessionFlags"));
  EXPECT_THAT(keysRead(1), ElementsAre("sessionType", "sender"));
  EXPECT_THAT(keysRead(2), ElementsAre("checkpoint", "session", "sender", "time"));
  EXPECT_THAT(keysRead(3), ElementsAre("description", "logString", "sessionType", "sender", "time"));
  EXPECT_THAT(keysRead(4), ElementsAre("category", "callInfo", "session", "sender"));
  EXPECT_THAT(keysRead(5), ElementsAre("description", "logString", "session", "sender"));
  EXPECT_THAT(keysRead(6), ElementsAre("description", "number", "session", "sender"));
  EXPECT_THAT(keysRead(7), ElementsAre("session", "sender"));
  EXPECT_THAT(keysRead(8), ElementsAre("action", "session", "sender"));
  EXPECT_THAT(keysRead(9), ElementsAre("action", "session", "sender", "userInfo"));
  EXPECT_THAT(keysRead(10), ElementsAre("event", "session", "sender"));
  EXPECT_THAT(keysRead(11), ElementsAre("initiator", "session", "sender"));
  EXPECT_THAT(keysRead(12), ElementsAre("receiver", "session", "sender"));
  EXPECT_THAT(keysRead(13), ElementsAre("failureReason", "session", "sender"));
  EXPECT_THAT(keysRead(14), ElementsAre("session", "sender", "category", "path"));
  EXPECT_THAT(keysRead(15), ElementsAre("category", "level", "logString", "sender", "time", "type"));
  EXPECT_THAT(keysRead(16), ElementsAre("category", "level", "eventString", "sender", "time", "type"));
}

TEST_F(MessageHandlerTest, AMessageWithoutAnyKeyBeginsASessionOfTypeCurrentWithoutSenderAndFlags) {
  send(FakeMessage{});
  EXPECT_THAT(registeredKeys(), ElementsAre("Current"));
  EXPECT_TRUE(session("Current")->isActive());
  EXPECT_FALSE(session("Current")->isInitiator());
  EXPECT_EQ(session("Current")->endFlags(), 0U);
  EXPECT_THAT(calls, ElementsAre("StartSessionCaptures 0"));
}

TEST_F(MessageHandlerTest, CodesAbove16AndNegativeOnesDoNothingAndLogNothingBeyondTheMessage) {
  fake.agentLog.enabledCategories = {"IPC"};
  const auto before = server->lastActivity();
  advance(1s);
  for (const std::int64_t code :
       {std::int64_t{17}, std::int64_t{-1}, std::numeric_limits<std::int64_t>::min(),
        std::numeric_limits<std::int64_t>::max()}) {
    fake.agentLog.lines.clear();
    send(code);
    EXPECT_THAT(fake.agentLog.lines, ElementsAre("log:IPC: received message from peer(4711): {a message}"));
  }
  EXPECT_THAT(registeredKeys(), IsEmpty());
  EXPECT_THAT(calls, IsEmpty());
  EXPECT_THAT(fake.logFacility.records, IsEmpty());
  EXPECT_EQ(server->lastActivity(), before);
  EXPECT_TRUE(peer->isConnected());
}

TEST_F(MessageHandlerTest, TheDescriptionOfAMessageIsMadeOnlyForALogThatIsSwitchedOn) {
  FakeMessage message{{"__ipc__event_code__", std::int64_t{10}}};
  send(message);
  EXPECT_EQ(message.descriptions, 0);
  EXPECT_THAT(fake.agentLog.lines, IsEmpty());
  fake.agentLog.enabledCategories = {"IPC"};
  send(message);
  EXPECT_EQ(message.descriptions, 1);
}

TEST_F(MessageHandlerTest, BarriersOfAPeerWhoseRequestEndedASessionWaitForItsFiles) {
  const auto other = std::make_shared<FakePeer>();
  beginVistel();
  for (const char* checkpoint : {"a", "b", "c"}) {
    send(2, {{"checkpoint", text(checkpoint)}, {"session", text("Vistel")}, {"time", 1714651388.5}});
  }
  EXPECT_FALSE(peer->holdsBarriers());
  beginVistel();  // ends the one that was open
  EXPECT_TRUE(peer->holdsBarriers());
  FakeMessage pulse{{"__ipc__event_code__", std::int64_t{7}}, {"session", std::string("Vistel")}};
  fake.ipc.onPeerEvent(other, IpcEvent{&pulse});
  EXPECT_FALSE(other->holdsBarriers());
  fake.queues.runAll();
  EXPECT_FALSE(peer->holdsBarriers());
  EXPECT_THAT(vistelFile("Log"), HasSubstr("[Sender: caller] End Session"));
}

TEST_F(MessageHandlerTest, AWholeSessionInRequestsGivesTheThreeFilesWhole) {
  beginVistel();
  send(11, {{"initiator", text("ann@example.org")}, {"session", text("Vistel")}, {"sender", text("caller")}});
  send(12, {{"receiver", text("bob@example.org")}, {"session", text("Vistel")}, {"sender", text("caller")}});
  send(13, {{"failureReason", text("hung up")}, {"session", text("Vistel")}, {"sender", text("caller")}});
  send(4, {{"category", text("Codec")},
           {"callInfo", text("opus")},
           {"session", text("Vistel")},
           {"sender", text("caller")}});
  send(2, {{"checkpoint", text("Connected")},
           {"session", text("Vistel")},
           {"sender", text("caller")},
           {"time", 1714651388.5}});
  send(3, {{"description", text("Offer")},
           {"logString", text("m=audio")},
           {"sessionType", text("Vistel")},
           {"sender", text("caller")},
           {"time", 1714651388.25}});
  send(5, {{"description", text("Video")},
           {"logString", text("fair")},
           {"session", text("Vistel")},
           {"sender", text("caller")}});
  sendMetric("rtt", Number{std::int64_t{20}});
  sendMetric("rtt", Number{25.5});
  sendMetric("rtt", std::nullopt);  // no number: no sample
  endVistel();
  const std::string identities =
      "[Failure Reason: hung up]\n[Recipient ID: bob@example.org]\n[Initiator ID: ann@example.org]\n";
  EXPECT_EQ(vistelFile("Log"),
            "[Time: Separator]\n[Reference Time: Unknown reference time!]\n[Codec: opus]\n" + identities +
                "[Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]\n"
                "[Sender: caller] Connected   [14:03:08.500  (2024-05-02) (CEST)]\n"
                "[Sender: caller] End Session  [14:03:10.251  (2024-05-02) (CEST)]\n");
  EXPECT_EQ(vistelFile("Verbose Log"),
            "[Time: Separator]\n[Reference Time: Unknown reference time!]\n[Codec: opus]\n" + identities +
                "[Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]\n"
                "[Sender: caller] Offer: m=audio   [14:03:08.250  (2024-05-02) (CEST)]\n"
                "[Sender: caller] Connected   [14:03:08.500  (2024-05-02) (CEST)]\n"
                "[Sender: caller] End Session  [14:03:10.251  (2024-05-02) (CEST)]\n");
  EXPECT_EQ(vistelFile("Quality Log"),
            "[Initiator ID: ann@example.org]\n[Recipient ID: bob@example.org]\n[Failure Reason: hung up]\n"
            "[Codec: opus]\n[Reference Time: Unknown reference time!]\n[Time: Separator]\n"
            "[Sender: caller] Video: fair   [14:03:07.251  (2024-05-02) (CEST)]\n"
            "[Sender: meter] rtt: 20   [14:03:07.251  (2024-05-02) (CEST)]\n"
            "[Sender: meter] rtt: 25.5   [14:03:07.251  (2024-05-02) (CEST)]\n"
            "[Sender: caller] End Session  [14:03:10.251  (2024-05-02) (CEST)]\n"
            "========================================\n  [rtt]\n Average: 22.75\n     Min: 20\n"
            "     Max: 25.5\n  Median: 22.75\n  StdDev: 2.75\n");
}

TEST_F(MessageHandlerTest, ADescriptionWithATimeBelow100IsStoredWithTheCurrentTimeOfDay) {
  beginVistel();
  for (const double time : {42.5, 99.999, 0.0, -5.0, std::numeric_limits<double>::quiet_NaN()}) {
    send(3, {{"description", text("early")},
             {"sessionType", text("Vistel")},
             {"sender", text("s")},
             {"time", time}});
  }
  send(3, {{"description", text("none")}, {"sessionType", text("Vistel")}, {"sender", text("s")}});
  send(3, {{"description", text("edge")},
           {"sessionType", text("Vistel")},
           {"sender", text("s")},
           {"time", 100.0}});
  endVistel();
  EXPECT_EQ(vistelFile("Verbose Log"),
            "[Time: Separator]\n[Reference Time: Unknown reference time!]\n"
            "[Sender: s] edge   [02:01:40.000  (1970-01-01) (CEST)]\n"
            "[Sender: s] none   [14:03:07.251  (2024-05-02) (CEST)]\n"
            "[Sender: s] early   [14:03:07.251  (2024-05-02) (CEST)]\n"
            "[Sender: s] early   [14:03:07.251  (2024-05-02) (CEST)]\n"
            "[Sender: s] early   [14:03:07.251  (2024-05-02) (CEST)]\n"
            "[Sender: s] early   [14:03:07.251  (2024-05-02) (CEST)]\n"
            "[Sender: s] early   [14:03:07.251  (2024-05-02) (CEST)]\n"
            "[Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]\n"
            "[Sender: caller] End Session  [14:03:10.251  (2024-05-02) (CEST)]\n");
}

TEST_F(MessageHandlerTest, ADescriptionIsAlsoALogRecordOfCategoryDefaultWithTime0) {
  send(3, {{"description", text("Offer")},
           {"logString", text("m=audio")},
           {"sessionType", text("Vistel")},
           {"sender", text("caller")},
           {"time", 1714651388.25}});
  EXPECT_THAT(fake.logFacility.records,
              ElementsAre(Kept{6, "Vistel", "Vistel", false, "[caller:Default] m=audio", 0}));
}

TEST_F(MessageHandlerTest, ADescriptionWithoutLogTextIsNoRecord) {
  send(3, {{"description", text("Offer")}, {"sessionType", text("Vistel")}});
  EXPECT_THAT(fake.logFacility.records, IsEmpty());
}

TEST_F(MessageHandlerTest, ACheckpointIsOneEventRecordWithAnEmptyCategoryAndTime0BeforeItReachesTheSession) {
  beginVistel();
  // The echo of the session comes from its own step: were it first, it would stand first.
  session("Vistel")->setLogCheckpointsToConsole(true);
  switchOn("ConsoleOutputTorvik");
  server->readLoggingPreferences();
  send(2, {{"checkpoint", text("Ringing")},
           {"session", text("Vistel")},
           {"sender", text("caller")},
           {"time", 1714651388.5}});
  EXPECT_THAT(fake.logFacility.records,
              ElementsAre(Kept{6, "Vistel", "Vistel-Event", false, "[caller:] Ringing", 0}));
  ASSERT_THAT(fake.agentLog.lines, SizeIs(2));
  EXPECT_EQ(fake.agentLog.lines[0], "console:: Ringing");
  EXPECT_THAT(fake.agentLog.lines[1], HasSubstr("=== [Sender: caller] Ringing"));
}

TEST_F(MessageHandlerTest, LogAndEventRecordsPassTheClientsTimeOnAndDropItsLevel) {
  const ValueMap common{{"level", std::int64_t{3}},
                        {"time", std::uint64_t{123}},
                        {"category", text("Y")},
                        {"sender", text("X")},
                        {"type", text("Nexa")}};
  ValueMap log = common;
  log["logString"] = text("Z");
  send(15, log);
  ValueMap event = common;
  event["eventString"] = text("W");
  send(16, event);
  EXPECT_THAT(fake.logFacility.records, ElementsAre(Kept{6, "Nexa", "Nexa", false, "[X:Y] Z", 123},
                                                    Kept{6, "Nexa", "Nexa-Event", false, "[X:Y] W", 123}));
}

TEST_F(MessageHandlerTest, ASignedTimeOfARecordReadsAsAbsent) {
  send(15, {{"logString", text("Z")}, {"time", std::int64_t{123}}});
  EXPECT_THAT(fake.logFacility.records,
              ElementsAre(Kept{6, "ZalLogging", "ZalLogging", false, "[(No Sender):(No Category)] Z", 0}));
}

TEST_F(MessageHandlerTest, APulseKeepsTheSessionActive) {
  beginVistel();
  advance(239s);
  send(7, {{"session", text("Vistel")}, {"sender", text("caller")}});
  advance(239s);
  EXPECT_THAT(registeredKeys(), ElementsAre("Vistel"));
}

TEST_F(MessageHandlerTest, AnActionIsHandedOnWithPeerAndRequestAndWithoutUserInfo) {
  FakeMessage message{{"__ipc__event_code__", std::int64_t{8}},
                      {"action", std::int64_t{14}},
                      {"session", std::string("Vistel")},
                      {"sender", std::string("caller")}};
  onAction = [&](const ActionRequest& request) {
    EXPECT_EQ(request.session, "Vistel");
    EXPECT_EQ(request.sender, "caller");
    EXPECT_EQ(request.peer, peer);
    EXPECT_EQ(request.request, &message);
    EXPECT_EQ(request.userInfo, nullptr);
  };
  send(message);
  EXPECT_THAT(calls, ElementsAre("action 14"));
}

TEST_F(MessageHandlerTest, AnActionWithUserInfoIsHandedOnWithTheConvertedMap) {
  const ValueMap info{{"useWifi", true}};
  std::optional<ValueMap> received;
  onAction = [&](const ActionRequest& request) {
    if (request.userInfo != nullptr) received = *request.userInfo;
  };
  send(9, {{"action", std::int64_t{15}}, {"userInfo", info}});
  EXPECT_THAT(calls, ElementsAre("action 15"));
  EXPECT_EQ(received, info);
}

TEST_F(MessageHandlerTest, AnActionNotesActivityBeforeAndAfter) {
  advance(10s);
  SteadyTime during;
  onAction = [&](const ActionRequest&) {
    EXPECT_EQ(server->lastActivity(), fake.host.steadyNow());
    advance(5s);
    during = fake.host.steadyNow();
  };
  send(8, {{"action", std::int64_t{99}}});
  EXPECT_EQ(server->lastActivity(), during);
}

TEST_F(MessageHandlerTest, Code10IsAcceptedAndHasNoEffect) {
  beginVistel();
  calls.clear();
  send(10, {{"event", std::int64_t{5}}, {"session", text("Vistel")}, {"sender", text("caller")}});
  EXPECT_THAT(calls, IsEmpty());
  EXPECT_THAT(fake.logFacility.records, IsEmpty());
  endVistel();
  EXPECT_EQ(vistelFile("Log"), "");  // begin and end alone are too few lines to write
}

TEST_F(MessageHandlerTest, AFileToCollectIsMovedBesideTheLogs) {
  testing::writeFile(fake.home / "tmp/trace.txt", "trace");
  beginVistel();
  for (const char* checkpoint : {"a", "b"}) {
    send(2, {{"checkpoint", text(checkpoint)}, {"session", text("Vistel")}, {"time", 1714651388.5}});
  }
  send(14, {{"session", text("Vistel")},
            {"sender", text("caller")},
            {"category", text("Traces")},
            {"path", fake.home / "tmp/trace.txt"}});
  endVistel();
  EXPECT_EQ(report("Vistel/2024-05-02 at 14-03-07 (CEST) (Receiver)/Traces/trace.txt"), "trace");
}

TEST_F(MessageHandlerTest, AValueOfAnotherTypeReadsAsAbsent) {
  send(0, {{"sessionType", std::int64_t{5}}, {"sender", 1.5}, {"beginSessionFlags", std::uint64_t{4}}});
  EXPECT_THAT(registeredKeys(), ElementsAre("Current"));
  EXPECT_FALSE(session("Current")->isInitiator());
}

TEST_F(MessageHandlerTest, AnInterruptedConnectionStaysUsable) {
  fake.agentLog.enabledCategories = {"IPC"};
  sendError(IpcError::connectionInterrupted);
  EXPECT_THAT(fake.agentLog.lines,
              ElementsAre("log:IPC: peer(4711) received IPC_ERROR_CONNECTION_INTERRUPTED"));
  EXPECT_TRUE(peer->isConnected());
}

TEST_F(MessageHandlerTest, AnInvalidConnectionIsCancelledEvenWhenTheIpcLogIsOff) {
  sendError(IpcError::connectionInvalid);
  EXPECT_FALSE(peer->isConnected());
  EXPECT_THAT(fake.agentLog.lines, IsEmpty());
  EXPECT_THAT(fake.processExit.exits, IsEmpty());
}

TEST_F(MessageHandlerTest, AnInvalidConnectionIsLoggedWhenTheIpcLogIsOn) {
  fake.agentLog.enabledCategories = {"IPC"};
  sendError(IpcError::connectionInvalid);
  EXPECT_THAT(fake.agentLog.lines, ElementsAre("log:IPC: peer(4711) received IPC_ERROR_CONNECTION_INVALID"));
  EXPECT_FALSE(peer->isConnected());
}

TEST_F(MessageHandlerTest, ImminentTerminationIsOnlyLogged) {
  sendError(IpcError::terminationImminent);
  EXPECT_THAT(fake.agentLog.lines, IsEmpty());
  fake.agentLog.enabledCategories = {"IPC"};
  sendError(IpcError::terminationImminent);
  EXPECT_THAT(fake.agentLog.lines,
              ElementsAre("log:IPC: peer(4711) received IPC_ERROR_TERMINATION_IMMINENT"));
  EXPECT_TRUE(peer->isConnected());
}

TEST_F(MessageHandlerTest, OtherErrorsAndOtherEventsAreIgnored) {
  fake.agentLog.enabledCategories = {"IPC"};
  sendError(IpcError::other);
  fake.ipc.onPeerEvent(peer, IpcEvent{});
  EXPECT_THAT(fake.agentLog.lines, IsEmpty());
  EXPECT_TRUE(peer->isConnected());
}

TEST_F(MessageHandlerTest, NoRequestIsAnswered) {
  for (std::int64_t code = 0; code <= 16; ++code) {
    FakeMessage message{{"__ipc__event_code__", code}};
    message.token = 7;
    send(message);
  }
  EXPECT_THAT(peer->replies, IsEmpty());
}

TEST_F(MessageHandlerTest, ARequestThatThrowsCostsNobodyElseAnything) {
  onAction = [](const ActionRequest&) { throw std::runtime_error("no memory"); };
  send(8, {{"action", std::int64_t{1}}});
  EXPECT_THAT(fake.agentLog.lines, ElementsAre("warning: A request of peer(4711) was given up: no memory"));
  send(15, {{"logString", text("Z")}});
  EXPECT_THAT(fake.logFacility.records, SizeIs(1));
}

}  // namespace
}  // namespace zal
