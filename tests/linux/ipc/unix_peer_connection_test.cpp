#include "platform/linux/ipc/unix_peer_connection.h"

#include <sys/socket.h>
#include <sys/syscall.h>

#include <atomic>
#include <cerrno>
#include <random>
#include <thread>

#include <flatbuffers/flexbuffers.h>

#include "platform/linux/wire/wire_message.h"
#include "tests/linux/ipc/ipc_fixture.h"
#include "tests/support/failing_calls.h"

namespace zal {
namespace {

using Lines = std::vector<std::string>;
using namespace std::chrono_literals;

class UnixPeerConnectionTest : public IpcFixture {
 protected:
  UnixPeerConnectionTest() { startService(); }
};

TEST_F(UnixPeerConnectionTest, MessagesArriveInOrderWithTheProcessIdOfTheirSender) {
  const TestClient client(path);
  ASSERT_TRUE(client.send(requestFrame(1, "one") + requestFrame(2, "two")));
  ASSERT_TRUE(runUntilEvents(2));
  EXPECT_EQ(events, (Lines{"1:one", "2:two"}));
  EXPECT_EQ(lastPeer->processId(), ::getpid());
  EXPECT_TRUE(lastPeer->isConnected());
}

TEST_F(UnixPeerConnectionTest, OneByteAtATimeGivesTheSameMessages) {
  const TestClient client(path);
  const std::string bytes = requestFrame(1, "first") + requestFrame(2, std::string(300, 'x'));
  for (const char byte : bytes) {
    ASSERT_TRUE(client.send({&byte, 1}));
    loop.context().poll();
  }
  ASSERT_TRUE(runUntilEvents(2));
  EXPECT_EQ(events, (Lines{"1:first", "2:" + std::string(300, 'x')}));
}

TEST_F(UnixPeerConnectionTest, NoCuttingOfTheStreamChangesTheMessages) {
  std::mt19937 random(11);  // NOLINT: the same cuttings every time
  std::string bytes;
  Lines expected;
  for (int i = 0; i < 300; ++i) {
    const std::string text(random() % 700, static_cast<char>('a' + i % 26));
    bytes += requestFrame(i, text);
    expected.push_back(std::to_string(i) + ":" + text);
  }
  const TestClient client(path);
  for (std::size_t at = 0; at < bytes.size();) {
    const std::size_t size = std::min<std::size_t>(1 + random() % 2000, bytes.size() - at);
    ASSERT_TRUE(client.send(std::string_view(bytes).substr(at, size)));
    loop.context().poll();
    at += size;
  }
  ASSERT_TRUE(runUntilEvents(expected.size()));
  EXPECT_EQ(events, expected);
}

TEST_F(UnixPeerConnectionTest, AMessageLargerThanTheReadBufferArrivesWhole) {
  const TestClient client(path);
  const std::string text(3U << 20U, 'L');
  std::thread writer([&] { EXPECT_TRUE(client.send(requestFrame(1, text) + requestFrame(2, "after"))); });
  EXPECT_TRUE(runUntilEvents(2));
  writer.join();
  EXPECT_EQ(events, (Lines{"1:" + text, "2:after"}));
}

TEST_F(UnixPeerConnectionTest, APayloadThatIsNoMapInterruptsAndThePeerStaysUsable) {
  const TestClient client(path);
  ASSERT_TRUE(client.send(bareFrame(FrameKind::message, 0, "noise") + bareFrame(FrameKind::message, 0, "") +
                          bareFrame(FrameKind::reply, 5, "") + requestFrame(1, "fine")));
  ASSERT_TRUE(runUntilEvents(4));
  EXPECT_EQ(events, (Lines{"interrupted", "interrupted", "interrupted", "1:fine"}));
  EXPECT_TRUE(lastPeer->isConnected());
  EXPECT_EQ(log.lines,
            Lines{"warning: peer(" + std::to_string(::getpid()) + ") of user " + std::to_string(::geteuid()) +
                  " sent a frame that is no request; it and others like it are skipped"});
}

TEST_F(UnixPeerConnectionTest, AHeaderThatCannotBeUnderstoodEndsTheConnectionWithOneWarning) {
  TestClient client(path);
  std::string bad(kFrameHeaderSize, '\0');
  storeFrameHeader(bad.data(), {0xFFFFFFF0U, kProtocolVersion, FrameKind::message, 0});
  ASSERT_TRUE(client.send(requestFrame(1, "before") + bad + requestFrame(2, "after")));
  ASSERT_TRUE(runUntilEvents(2));
  EXPECT_TRUE(runUntil([&] { return client.seesTheEnd(); }));
  EXPECT_EQ(events, (Lines{"1:before", "invalid"}));
  EXPECT_FALSE(lastPeer->isConnected());
  EXPECT_EQ(log.lines,
            Lines{"warning: peer(" + std::to_string(::getpid()) + ") of user " + std::to_string(::geteuid()) +
                  " cannot be understood: payload of 4294967280 bytes, at most 16777216 are allowed; it is "
                  "disconnected"});
}

TEST_F(UnixPeerConnectionTest, EverythingSentBeforeTheEndIsDeliveredThenInvalidOnce) {
  TestClient client(path);
  ASSERT_TRUE(client.send(requestFrame(1) + requestFrame(2) + requestFrame(3).substr(0, 20)));
  client.close();
  ASSERT_TRUE(runUntilEvents(3));
  runFor(20ms);
  EXPECT_EQ(events, (Lines{"1:", "2:", "invalid"}));
  EXPECT_EQ(service->peerCount(), 0U);
}

TEST_F(UnixPeerConnectionTest, AHalfOpenPeerIsInvalidOnceItStopsWriting) {
  TestClient client(path);
  ASSERT_TRUE(client.send(requestFrame(1) + bareFrame(FrameKind::barrier, 9)));
  client.endWriting();
  ASSERT_TRUE(runUntilEvents(2));
  EXPECT_EQ(events, (Lines{"1:", "invalid"}));
  EXPECT_TRUE(runUntil([&] { return client.seesTheEnd(); }));
  EXPECT_EQ(client.frames(), Lines{"4/9/0"});
}

TEST_F(UnixPeerConnectionTest, AResetWithUnreadAnswersStillDeliversWhatWasSent) {
  TestClient client(path);
  ASSERT_TRUE(client.send(bareFrame(FrameKind::barrier, 1)));
  ASSERT_TRUE(runUntil([this] { return flushes > 0; }));
  ASSERT_TRUE(client.send(requestFrame(7, "last")));
  client.close();  // the barrier's answer was never read: the kernel resets the connection
  ASSERT_TRUE(runUntilEvents(2));
  EXPECT_EQ(events, (Lines{"7:last", "invalid"}));
}

TEST_F(UnixPeerConnectionTest, WhatComesAloneIsWrittenOutBeforeTheLoopLooksAround) {
  TestClient client(path);
  ASSERT_TRUE(client.send(requestFrame(1)));
  ASSERT_TRUE(runUntilEvents(1));
  EXPECT_EQ(flushes, 1);
}

TEST_F(UnixPeerConnectionTest, ABarrierIsAnsweredAfterWhatCameBeforeItWasHandledAndFlushed) {
  TestClient client(path);
  Lines order;
  onEvent = [&](const auto&, const IpcEvent& event) {
    order.push_back(described(event) + " after " + std::to_string(flushes) + " flushes");
  };
  ASSERT_TRUE(client.send(requestFrame(1) + requestFrame(2) +
                          bareFrame(FrameKind::barrier, 0xABCDEF0123456789U) + requestFrame(3)));
  ASSERT_TRUE(runUntilEvents(3));
  EXPECT_EQ(order, (Lines{"1: after 0 flushes", "2: after 0 flushes", "3: after 1 flushes"}));
  EXPECT_EQ(client.frames(), Lines{"4/12379813738877118345/0"});
}

TEST_F(UnixPeerConnectionTest, BarriersWaitForWhatAMessageOfThatPeerSetGoingAndForNobodyElses) {
  std::shared_ptr<void> hold;
  onEvent = [&](const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) {
    if (described(event) == "1:") hold = peer->holdBarriers();
    if (described(event) == "2:") EXPECT_EQ(peer->holdBarriers(), hold);
  };
  TestClient client(path), other(path);
  ASSERT_TRUE(client.send(requestFrame(1) + bareFrame(FrameKind::barrier, 7) + requestFrame(2) +
                          bareFrame(FrameKind::barrier, 8)));
  ASSERT_TRUE(runUntilEvents(2));
  ASSERT_TRUE(other.send(requestFrame(3) + bareFrame(FrameKind::barrier, 9)));
  ASSERT_TRUE(runUntil([&] { return other.frames() == Lines{"4/9/0"}; }));
  EXPECT_EQ(client.frames(), Lines{});
  hold.reset();
  EXPECT_TRUE(runUntil([&] { return client.frames() == Lines{"4/7/0", "4/8/0"}; }));
  ASSERT_TRUE(client.send(bareFrame(FrameKind::barrier, 10)));
  EXPECT_TRUE(runUntil([&] { return client.frames().back() == "4/10/0"; }));
}

TEST_F(UnixPeerConnectionTest, AHalfOpenPeerStillGetsTheAnswersThatWereHeld) {
  std::shared_ptr<void> hold;
  onEvent = [&](const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) {
    if (described(event) == "1:") hold = peer->holdBarriers();
  };
  TestClient client(path);
  ASSERT_TRUE(client.send(requestFrame(1) + bareFrame(FrameKind::barrier, 9)));
  client.endWriting();
  ASSERT_TRUE(runUntilEvents(1));
  runFor(20ms);
  EXPECT_EQ(events, Lines{"1:"});
  hold.reset();
  ASSERT_TRUE(runUntilEvents(2));
  EXPECT_EQ(events.back(), "invalid");
  EXPECT_TRUE(runUntil([&] { return client.seesTheEnd(); }));
  EXPECT_EQ(client.frames(), Lines{"4/9/0"});
}

TEST_F(UnixPeerConnectionTest, AFloodOfHeldBarriersIsBounded) {
  settings.maximumReplyBacklog = 1000;
  listener.reset();
  startService();
  std::shared_ptr<void> hold;
  onEvent = [&](const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) {
    if (described(event) == "1:") hold = peer->holdBarriers();
  };
  TestClient client(path);
  std::string frames = requestFrame(1);
  for (int i = 0; i < 1000; ++i) frames += bareFrame(FrameKind::barrier, 1);
  ASSERT_TRUE(client.send(frames));
  ASSERT_TRUE(runUntilEvents(2));
  EXPECT_EQ(events, (Lines{"1:", "invalid"}));
  lastPeer.reset();
  hold.reset();  // whoever had it is gone
  runFor(5ms);
  EXPECT_EQ(events, (Lines{"1:", "invalid"}));
}

/// An agent of the thread in which its answers fail.
class UnansweringAgent : public IpcFixture {
 public:
  void play() {
    startService();
    TestClient client(path);
    ASSERT_TRUE(client.send(requestFrame(1) + bareFrame(FrameKind::barrier, 5)));
    EXPECT_TRUE(runUntil([&] { return client.seesTheEnd(); }));
    EXPECT_EQ(client.frames(), Lines{});
    EXPECT_EQ(events, Lines{"1:"});
    TestClient next(path);
    ASSERT_TRUE(next.send(bareFrame(FrameKind::barrier, 6)));
    EXPECT_TRUE(runUntil([&] { return next.frames() == Lines{"4/6/0"}; }));
  }

 private:
  void TestBody() override {}
};

TEST(UnixPeerConnectionFailureTest, AClientWhoseAnswerTheKernelRefusesSeesTheEndInsteadOfWaiting) {
  const testing::FailingCall answer{SYS_sendto, ENOBUFS, 1, [](const std::uint64_t* words) {
                                      return (words[3] & static_cast<std::uint64_t>(MSG_DONTWAIT)) != 0;
                                    }};
  if (!testing::withFailingCalls({answer}, [] { UnansweringAgent().play(); }))
    GTEST_SKIP() << "the host lets no system call fail";
}

TEST_F(UnixPeerConnectionTest, AReplyRepeatsTheTokenAndReadsBack) {
  TestClient client(path);
  onEvent = [](const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) {
    const auto token = std::get<const Message*>(event)->replyToken();
    if (token) {
      EXPECT_TRUE(peer->sendReply(*token, {{"action", Value(std::int64_t{14})}}));
    }
  };
  ASSERT_TRUE(client.send(requestFrame(1) + requestFrame(2, "", FrameKind::messageExpectingReply, 42)));
  ASSERT_TRUE(runUntil([&] { return !client.frames().empty(); }));
  ASSERT_EQ(client.frames().size(), 1U);
  EXPECT_EQ(client.frames()[0].substr(0, 5), "2/42/");
  const std::string payload = client.payloads()[0];
  const auto reply = WireMessage::fromFrame({FrameHeader{}, payload});
  ASSERT_TRUE(reply.has_value());
  EXPECT_EQ(reply->description(), R"({"action": 14})");
}

TEST_F(UnixPeerConnectionTest, AReplyLargerThanTheKernelTakesAtOnceArrivesWhole) {
  service->terminationImminent();  // nobody there yet: no effect
  TestClient client(path);
  const std::string text(900'000, 'r');
  onEvent = [&](const std::shared_ptr<PeerConnection>& peer, const IpcEvent&) {
    EXPECT_TRUE(peer->sendReply(1, {{"text", Value(text)}}));
  };
  ASSERT_TRUE(client.send(requestFrame(1, "", FrameKind::messageExpectingReply, 1)));
  ASSERT_TRUE(runUntil([&] { return !client.frames().empty(); }));
  const auto reply = WireMessage::fromFrame({FrameHeader{}, client.payloads()[0]});
  ASSERT_TRUE(reply.has_value());
  EXPECT_EQ(reply->string("text"), text);
}

TEST_F(UnixPeerConnectionTest, APeerThatNeverReadsIsDroppedWithOneWarning) {
  TestClient client(path);
  int accepted = 0;
  onEvent = [&](const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) {
    if (!std::holds_alternative<const Message*>(event)) return;
    if (peer->sendReply(1, {{"text", Value(std::string(100'000, 'r'))}})) ++accepted;
  };
  for (int i = 0; i < 40; ++i)
    ASSERT_TRUE(client.send(requestFrame(i, "", FrameKind::messageExpectingReply, 1)));
  ASSERT_TRUE(runUntil([this] { return service->peerCount() == 0; }));
  runFor(20ms);
  EXPECT_GE(accepted, 10);
  EXPECT_LT(accepted, 40);
  EXPECT_EQ(events.back(), "invalid");
  EXPECT_EQ(log.lines, Lines{"warning: peer(" + std::to_string(::getpid()) + ") of user " +
                             std::to_string(::geteuid()) + " does not read its replies; it is disconnected"});
}

TEST_F(UnixPeerConnectionTest, AFloodOfUnreadBarriersIsBoundedToo) {
  settings.maximumReplyBacklog = 1000;
  listener.reset();
  startService();
  TestClient client(path);
  std::string barriers;
  for (int i = 0; i < 100'000; ++i) barriers += bareFrame(FrameKind::barrier, 1);
  std::thread writer([&] { static_cast<void>(client.send(barriers)); });
  EXPECT_TRUE(runUntilEvents(1));
  writer.join();
  EXPECT_EQ(events, Lines{"invalid"});
}

TEST_F(UnixPeerConnectionTest, CancelInsideTheHandlerStopsEverythingAfterIt) {
  TestClient client(path);
  onEvent = [](const std::shared_ptr<PeerConnection>& peer, const IpcEvent&) {
    peer->cancel();
    EXPECT_FALSE(peer->isConnected());
    EXPECT_FALSE(peer->sendReply(1, {}));
    peer->cancel();
  };
  ASSERT_TRUE(client.send(requestFrame(1) + requestFrame(2) + bareFrame(FrameKind::message, 0, "noise")));
  EXPECT_TRUE(runUntil([&] { return client.seesTheEnd(); }));
  EXPECT_EQ(events, Lines{"1:"});
}

TEST_F(UnixPeerConnectionTest, AnInvalidPeerMayBeCancelledByItsHandler) {
  TestClient client(path);
  onEvent = [](const std::shared_ptr<PeerConnection>& peer, const IpcEvent&) { peer->cancel(); };
  client.close();
  EXPECT_TRUE(runUntilEvents(1));
  EXPECT_EQ(events, Lines{"invalid"});
}

TEST_F(UnixPeerConnectionTest, TerminationIsSaidToEveryPeerAndLeavesItConnected) {
  const TestClient first(path);
  const TestClient second(path);
  ASSERT_TRUE(runUntil([this] { return service->peerCount() == 2; }));
  service->terminationImminent();
  EXPECT_EQ(events, (Lines{"termination", "termination"}));
  ASSERT_TRUE(first.send(requestFrame(1)));
  ASSERT_TRUE(runUntilEvents(3));
  EXPECT_EQ(events.back(), "1:");
}

TEST_F(UnixPeerConnectionTest, APeerKeptBeyondTheServiceIsDisconnectedAndHarmless) {
  TestClient client(path);
  ASSERT_TRUE(client.send(requestFrame(1)));
  ASSERT_TRUE(runUntilEvents(1));
  const auto kept = lastPeer;
  listener.reset();
  service.reset();
  EXPECT_FALSE(kept->isConnected());
  EXPECT_FALSE(kept->sendReply(1, {{"a", Value(true)}}));
  kept->cancel();
  EXPECT_EQ(kept->processId(), ::getpid());
  EXPECT_TRUE(client.seesTheEnd());
  EXPECT_EQ(events, Lines{"1:"});
}

TEST_F(UnixPeerConnectionTest, AFloodingClientDoesNotSilenceTheOthers) {
  // Frames of 1 KiB, so a turn's read of 256 KiB holds at most 256 of them.
  const std::string frame = requestFrame(1, std::string(960, 'f'));
  ASSERT_LE(frame.size(), 1024U);
  const TestClient flood(path);
  const int size = 8 << 20;
  ::setsockopt(flood.socket(), SOL_SOCKET, SO_SNDBUFFORCE, &size, sizeof size);  // full reads, where allowed
  const TestClient other(path);
  constexpr int kFrames = 40'000;
  int handled = 0;
  int sentAt = 0;
  int heardAt = 0;
  onEvent = [&](const auto&, const IpcEvent& event) {
    events.clear();
    if (std::get<const Message*>(event)->int64("code") == 2) heardAt = handled;
    if (++handled == 10'000) {
      EXPECT_TRUE(other.send(requestFrame(2)));
      sentAt = handled;
    }
  };
  std::thread writer([&] {
    std::string many;
    for (int i = 0; i < 100; ++i) many += frame;
    for (int i = 0; i < kFrames; i += 100) EXPECT_TRUE(flood.send(many));
  });
  EXPECT_TRUE(runUntil([&] { return handled == kFrames + 1; }, 60s));
  writer.join();
  EXPECT_EQ(sentAt, 10'000);
  EXPECT_GT(heardAt, 0);
  EXPECT_LE(heardAt - sentAt, 4 * 256);
}

}  // namespace
}  // namespace zal
