#include "platform/linux/bus/door/named_door.h"

#include <unistd.h>

#include <gmock/gmock.h>

#include "tests/linux/bus_door/door_fixture.h"

namespace zal::testing {
namespace {

using ::testing::ElementsAre;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

constexpr const char* kInvalid = "error 0";
constexpr const char* kImminent = "error 2";
constexpr const char* kLimits = "org.freedesktop.DBus.Error.LimitsExceeded";

Dictionary tagged(const std::string& tag) { return {{"tag", sdbus::Variant(tag)}}; }

class NamedDoorTest : public DoorFixture {};

TEST_F(NamedDoorTest, ARequestReachesTheHandlerAndIsAnsweredWithAnEmptyDictionaryAtOnce) {
  open();
  BusVisitor visitor(bus.address());
  const CallResult result = resultOf(visitor.call(tagged("first")));
  EXPECT_EQ(result.error, "");
  EXPECT_THAT(result.reply, IsEmpty());
  EXPECT_THAT(texts(), ElementsAre(R"({"tag": "first"})"));
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(NamedDoorTest, WhatWasLoggedIsInItsFilesBeforeTheAnswer) {
  bool wasFlushed = false;
  host.flush = [&] { wasFlushed = true; };
  onMessage = [&](const Message&) { EXPECT_FALSE(wasFlushed); };
  open();
  BusVisitor visitor(bus.address());
  EXPECT_EQ(resultOf(visitor.call(tagged("x"))).error, "");
  EXPECT_TRUE(wasFlushed);
}

TEST_F(NamedDoorTest, BusctlAndGdbusAreClients) {
  if (!std::filesystem::exists("/usr/bin/gdbus")) GTEST_SKIP() << "gdbus is not installed";
  open();
  EXPECT_EQ(outputWhileServing(busctlWords({"2", "code", "i", "3", "text", "s", "a b"})), "a{sv} 0");
  EXPECT_EQ(
      outputWhileServing({"env", "DBUS_SYSTEM_BUS_ADDRESS=" + bus.address(), "gdbus", "call", "--system",
                          "--dest", "com.vendel.lirra", "--object-path", "/com/vendel/lirra", "--method",
                          "com.vendel.Lirra.Request", "{'d': <{'x': <uint32 7>}>, 'n': <4.5>}"}),
      "(@a{sv} {},)");
  runUntil([this] { return events.size() == 4; });
  EXPECT_THAT(texts(), ElementsAre(R"({"code": 3, "text": "a b"})", kInvalid, R"({"d": {"x": 7u}, "n": 4.5})",
                                   kInvalid));
}

TEST_F(NamedDoorTest, WhoKeepsThePeerOwesTheAnswer) {
  open();
  keepsPeers = true;
  BusVisitor visitor(bus.address());
  auto answer = visitor.call(tagged("dump"));
  ASSERT_TRUE(runUntil([this] { return events.size() == 1; }));
  runFor(std::chrono::milliseconds(30));
  EXPECT_EQ(answer.wait_for(std::chrono::seconds(0)), std::future_status::timeout);
  EXPECT_TRUE(events[0].peer->isConnected());
  EXPECT_EQ(events[0].peer->processId(), ::getpid());
  EXPECT_TRUE(events[0].peer->sendReply(
      *events[0].token,
      {{"action", std::int64_t{14}}, {"replyResult", ValueMap{{"logPath", std::string("/a.zip")}}}}));
  const CallResult result = resultOf(std::move(answer));
  EXPECT_EQ(result.error, "");
  EXPECT_EQ(result.reply.at("action").get<std::int64_t>(), 14);
  EXPECT_EQ(result.reply.at("replyResult").get<Dictionary>().at("logPath").get<std::string>(), "/a.zip");
  EXPECT_FALSE(events[0].peer->sendReply(*events[0].token, {})) << "a call is answered once";
}

TEST_F(NamedDoorTest, AnAnswerThatNobodyOwesAnyMoreIsEmptyWhoeverGaveItUp) {
  open();
  keepsPeers = true;
  BusVisitor visitor(bus.address());
  auto onMain = visitor.call(tagged("one"));
  auto onQueue = visitor.call(tagged("two"));
  ASSERT_TRUE(runUntil([this] { return events.size() == 2; }));
  queues.global(QueuePriority::background).async([peer = std::move(events[1].peer)]() mutable {
    peer.reset();
  });
  events[0].peer.reset();
  EXPECT_EQ(resultOf(std::move(onMain)).error, "");
  EXPECT_EQ(resultOf(std::move(onQueue)).error, "");
}

TEST_F(NamedDoorTest, OneCallerIsOnePeerHoweverOftenItCalls) {
  open();
  keepsPeers = true;
  BusVisitor first(bus.address());
  BusVisitor second(bus.address());
  auto answers = std::vector<std::future<CallResult>>();
  answers.push_back(first.call(tagged("a")));
  answers.push_back(first.call(tagged("b")));
  ASSERT_TRUE(runUntil([this] { return events.size() == 2; }));
  answers.push_back(second.call(tagged("c")));
  ASSERT_TRUE(runUntil([this] { return events.size() == 3; }));
  EXPECT_THAT(texts(), ElementsAre(R"({"tag": "a"})", R"({"tag": "b"})", R"({"tag": "c"})"));
  EXPECT_EQ(events[0].peer.get(), events[1].peer.get());
  EXPECT_NE(events[0].peer.get(), events[2].peer.get());
}

TEST_F(NamedDoorTest, ACallerThatLeavesTheBusIsAnInvalidConnectionOnce) {
  open();
  keepsPeers = true;
  auto visitor = std::make_unique<BusVisitor>(bus.address());
  auto answer = visitor->call(tagged("dump"));
  ASSERT_TRUE(runUntil([this] { return events.size() == 1; }));
  visitor.reset();
  ASSERT_TRUE(runUntil([this] { return events.size() == 2; }));
  EXPECT_EQ(events[1].text, kInvalid);
  EXPECT_FALSE(events[0].peer->isConnected());
  EXPECT_FALSE(events[0].peer->sendReply(*events[0].token, {}));
  runFor(std::chrono::milliseconds(30));
  EXPECT_EQ(events.size(), 2U);
}

TEST_F(NamedDoorTest, ARequestThatWantsNoReplyHasNoTokenAndGetsNone) {
  open();
  keepsPeers = true;
  BusVisitor visitor(bus.address());
  visitor.callWithoutReply(tagged("quiet"));
  ASSERT_TRUE(runUntil([this] { return events.size() == 1; }));
  EXPECT_EQ(events[0].token, std::nullopt);
  EXPECT_FALSE(events[0].peer->sendReply(1, {}));
}

TEST_F(NamedDoorTest, ACancelledCallerIsToldSoAndMayCallAgain) {
  open();
  keepsPeers = true;
  BusVisitor visitor(bus.address());
  auto cancelled = visitor.call(tagged("one"));
  ASSERT_TRUE(runUntil([this] { return events.size() == 1; }));
  events[0].peer->cancel();
  EXPECT_EQ(resultOf(std::move(cancelled)).error, "org.freedesktop.DBus.Error.Disconnected");
  keepsPeers = false;
  EXPECT_EQ(resultOf(visitor.call(tagged("two"))).error, "");
  EXPECT_THAT(texts(), ElementsAre(R"({"tag": "one"})", R"({"tag": "two"})"));
}

TEST_F(NamedDoorTest, PeersHearOfTheTermination) {
  open();
  BusVisitor first(bus.address());
  BusVisitor second(bus.address());
  resultOf(first.call(tagged("a")));
  resultOf(second.call(tagged("b")));
  door->terminationImminent();
  EXPECT_THAT(texts(), ElementsAre(R"({"tag": "a"})", R"({"tag": "b"})", kImminent, kImminent));
}

TEST_F(NamedDoorTest, ANameThatIsTakenIsSaidOnceAndComesWhenItIsFree) {
  auto other = std::make_unique<BusConnection>(host, host.systemBus, "other");
  auto otherDoor = std::make_unique<NamedDoor>(host, *other, "other");
  otherDoor->open([](const auto&, const auto&) {});
  ASSERT_TRUE(runUntil([this] { return bus.hasOwner("com.vendel.lirra"); }));
  open();
  ASSERT_TRUE(runUntil([this] { return !log.lines.empty(); }));
  EXPECT_THAT(log.lines,
              ElementsAre("warning: The name com.vendel.lirra on the system bus is taken; requests come "
                          "by the socket alone"));
  otherDoor.reset();
  other.reset();
  runFor(std::chrono::milliseconds(1));
  BusVisitor visitor(bus.address());
  ASSERT_TRUE(runUntil([&] { return bus.hasOwner("com.vendel.lirra"); }));
  EXPECT_EQ(resultOf(visitor.call(tagged("mine"))).error, "");
  EXPECT_THAT(texts(), ElementsAre(R"({"tag": "mine"})"));
}

TEST_F(NamedDoorTest, ABusThatDiesEndsThePeersAndHasTheNameAgainWhenItIsBack) {
  open();
  keepsPeers = true;
  const ChildProgram caller({.command = busctlProgram({"0"})});
  ASSERT_TRUE(runUntil([this] { return events.size() == 1; }));
  bus.kill();
  ASSERT_TRUE(runUntil([this] { return events.size() == 2; }));
  EXPECT_EQ(events[1].text, kInvalid);
  EXPECT_FALSE(events[0].peer->isConnected());
  bus.start();
  ASSERT_TRUE(runUntil([this] { return bus.hasOwner("com.vendel.lirra"); }));
  keepsPeers = false;
  BusVisitor visitor(bus.address());
  EXPECT_EQ(resultOf(visitor.call(tagged("after"))).error, "");
  EXPECT_EQ(log.lines.size(), 2U) << "lost, and back";
}

TEST_F(NamedDoorTest, WhatTheHandlerThrowsIsTheLoopsAndTheCallerGetsItsAnswer) {
  open();
  onMessage = [](const Message&) { throw std::logic_error("too far"); };
  BusVisitor visitor(bus.address());
  auto answer = visitor.call(tagged("x"));
  EXPECT_THROW(resultOf(std::move(answer)), std::logic_error);
  onMessage = [](const Message&) {};
  EXPECT_EQ(resultOf(visitor.call(tagged("y"))).error, "");
}

TEST_F(NamedDoorTest, SixtyFourCallsMayBeOpenAtOnce) {
  open();
  keepsPeers = true;
  BusVisitor visitor(bus.address());
  resultOf([&] {
    auto first = visitor.call(tagged("0"));
    EXPECT_TRUE(runUntil([this] { return events.size() == 1; }));
    events[0].peer.reset();
    return first;
  }());
  std::vector<std::future<CallResult>> open;
  for (int i = 1; i <= 64; ++i) open.push_back(visitor.call(tagged(std::to_string(i))));
  EXPECT_EQ(resultOf(visitor.call(tagged("65"))).error, kLimits);
  EXPECT_EQ(events.size(), 65U);
  events.clear();
  EXPECT_EQ(resultOf(std::move(open.back())).error, "");
}

TEST_F(NamedDoorTest, RequestsThatComeBeforeTheBusSaidWhoCallsKeepTheirOrderAndHaveABound) {
  open();
  BusVisitor visitor(bus.address());
  std::vector<std::future<CallResult>> answers;
  for (int i = 0; i < 50; ++i) answers.push_back(visitor.call(tagged(std::to_string(i))));
  EXPECT_EQ(resultOf(std::move(answers.back())).error, "");
  ASSERT_EQ(events.size(), 50U);
  for (std::size_t i = 0; i < 50; ++i) EXPECT_EQ(events[i].text, "{\"tag\": \"" + std::to_string(i) + "\"}");
}

TEST_F(NamedDoorTest, TheProgressOfADumpIsASignal) {
  open();
  TemporaryDirectory directory;
  const std::string output = directory / "monitor";
  ChildProgram monitor({.command = {"/usr/bin/env", "busctl", "--address=" + bus.address(), "--json=short",
                                    "monitor", "--match=type='signal',member='Progress'"},
                        .output = output,
                        .errors = directory / "errors"});
  const DumpNews news{.directory = "/r/\xFF",
                      .service = "Vistel",
                      .event = "missing",
                      .step = 2,
                      .steps = 7,
                      .what = "the radio",
                      .detail = std::string(5000, 'x')};
  // A monitor says nothing before its first message.
  ASSERT_TRUE(runUntil([&] {
    door->announce(news);
    runFor(std::chrono::milliseconds(20));
    return readFile(output).find('\n') != std::string::npos;
  }));
  EXPECT_THAT(
      readFile(output),
      HasSubstr("\"member\":\"Progress\",\"payload\":{\"type\":\"sssuuss\",\"data\":[\"/r/\xEF\xBF\xBD\","
                "\"Vistel\",\"missing\",2,7,\"the radio\",\"" +
                std::string(4096, 'x') + "\"]}"));
}

TEST_F(NamedDoorTest, IntrospectionShowsTheMethodAndTheSignals) {
  open();
  EXPECT_EQ(outputWhileServing({"busctl", "--address=" + bus.address(), "--no-legend", "--no-pager",
                                "introspect", "com.vendel.lirra", "/com/vendel/lirra", "com.vendel.Lirra"}),
            ".Request                  method    a{sv}     a{sv}        -\n"
            ".LirraLoggingDumpComplete signal    s         -            -\n"
            ".Progress                 signal    sssuuss   -            -\n"
            ".kLirraSyncLoggingPrefs   signal    s         -            -");
}

/// Who is let in: the test runs others as another user, which only the superuser can.
class NamedDoorAccessTest : public NamedDoorTest {
 protected:
  void SetUp() override {
    NamedDoorTest::SetUp();
    if (::geteuid() != 0) GTEST_SKIP() << "needs the superuser";
    bus.letEverybodyConnect();
  }
  std::string callAsNobody() {
    std::vector<std::string> words = busctlWords({"1", "tag", "s", "stranger"});
    words.insert(words.begin(), {"setpriv", "--reuid=65534", "--regid=65534", "--clear-groups"});
    return outputWhileServing(words);
  }
};

TEST_F(NamedDoorAccessTest, AStrangerIsRefusedWithOneWarningAndReachesNothing) {
  open();
  EXPECT_THAT(callAsNobody(), HasSubstr("Access denied"));
  EXPECT_THAT(events, IsEmpty());
  ASSERT_EQ(log.lines.size(), 1U);
  EXPECT_THAT(log.lines[0],
              ::testing::MatchesRegex("warning: Process [0-9]+ of user 65534 may not talk to the agent "
                                      "over the system bus; it is refused"));
}

TEST_F(NamedDoorAccessTest, AMemberOfTheConfiguredGroupIsLetIn) {
  configuration.ipc.group = "nogroup";
  open();
  EXPECT_EQ(callAsNobody(), "a{sv} 0");
  EXPECT_EQ(events.at(0).text, R"({"tag": "stranger"})");
  EXPECT_THAT(log.lines, IsEmpty());
}

/// What callers may send is data, and has its bounds.
class NamedDoorLimitsTest : public NamedDoorTest {
 protected:
  static sdbus::Variant nested(int depth) {
    sdbus::Variant value(std::string("deep"));
    for (int i = 0; i < depth; ++i) value = sdbus::Variant(Dictionary{{"k", value}});
    return value;
  }
  std::string errorOf(const Dictionary& request) {
    BusVisitor visitor(bus.address());
    return resultOf(visitor.call(request)).error;
  }
};

TEST_F(NamedDoorLimitsTest, ContainersMayLieInEachOther32Deep) {
  open();
  // The request itself is one, and each dictionary in it stands in a variant.
  EXPECT_EQ(errorOf({{"d", nested(15)}}), "");
  EXPECT_EQ(errorOf({{"d", nested(16)}}), kLimits);
  EXPECT_THAT(texts(), ElementsAre(HasSubstr("deep"), kInvalid));
}

TEST_F(NamedDoorLimitsTest, ARequestMayHave65536Values) {
  open();
  // The list is one, too.
  EXPECT_EQ(errorOf({{"l", sdbus::Variant(std::vector<std::uint8_t>(65'535))}}), "");
  EXPECT_EQ(errorOf({{"l", sdbus::Variant(std::vector<std::uint8_t>(65'536))}}), kLimits);
}

TEST_F(NamedDoorLimitsTest, TextMayHaveAsManyBytesAsAPayloadOfTheSocket) {
  configuration.ipc.maximumPayload = 4096;
  open();
  EXPECT_EQ(errorOf({{"t", sdbus::Variant(std::string(4095, 'x'))}}), "");
  EXPECT_EQ(errorOf({{"t", sdbus::Variant(std::string(4096, 'x'))}}), kLimits);
}

TEST_F(NamedDoorLimitsTest, OtherSignaturesAreNoRequests) {
  open();
  std::vector<std::string> words = busctlWords({});
  words.back() = "a{ss}";
  words.emplace_back("0");
  EXPECT_THAT(outputWhileServing(words), HasSubstr("Invalid arguments 'a{ss}'"));
  words.resize(words.size() - 2);
  EXPECT_THAT(outputWhileServing(words), HasSubstr("Invalid arguments ''"));
  EXPECT_THAT(events, IsEmpty());
}

TEST_F(NamedDoorLimitsTest, TwoHundredFiftySixCallersAreServedAtOnce) {
  open();
  std::vector<std::unique_ptr<BusVisitor>> visitors;
  for (int i = 0; i < 256; ++i) {
    visitors.push_back(std::make_unique<BusVisitor>(bus.address()));
    ASSERT_EQ(resultOf(visitors.back()->call(tagged("x"))).error, "");
  }
  EXPECT_EQ(errorOf(tagged("one too many")), kLimits);
  EXPECT_EQ(errorOf(tagged("another")), kLimits);
  EXPECT_THAT(log.lines,
              ElementsAre("warning: More than 256 callers on the system bus; further ones are refused"));
  visitors.pop_back();
  ASSERT_TRUE(runUntil([this] { return events.back().text == kInvalid; }));
  EXPECT_EQ(errorOf(tagged("there is room again")), "");
}

}  // namespace
}  // namespace zal::testing
