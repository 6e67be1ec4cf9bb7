#include <algorithm>
#include <optional>
#include <thread>

#include "platform/linux/ipc/client_shares.h"
#include "tests/linux/ipc/ipc_fixture.h"

namespace zal {
namespace {

constexpr std::int64_t kFlood = 1;
constexpr std::int64_t kOther = 2;
constexpr std::size_t kMessages = 4000;

/// Each message of a flood holds memory as large as itself until the test gives it back.
class ClientMemoryTest : public IpcFixture {
 protected:
  ClientMemoryTest() {
    options.memory = &memory;
    options.sharesPath = shares;
    startService();
    flooding.emplace(path);
    other.emplace(path);
    onEvent = [this](const std::shared_ptr<PeerConnection>&, const IpcEvent& event) {
      const auto* const message = std::get_if<const Message*>(&event);
      if (message == nullptr || (*message)->int64("code") != kFlood) return;
      ++arrived;
      hold.add((*message)->string("text")->size());
    };
    for (std::size_t number = 0; number < kMessages; ++number) flood += requestFrame(kFlood, text);
  }
  ~ClientMemoryTest() override {
    ::shutdown(flooding->socket(), SHUT_RDWR);  // wakes the sender
    if (sender.joinable()) sender.join();
  }
  void beginFlood() {
    sender = std::thread([this] { static_cast<void>(flooding->send(flood)); });
  }
  bool isBarrierAnswered(const std::string& frame) {
    return runUntil([&] {
      const auto& frames = other->frames();
      return std::find(frames.begin(), frames.end(), frame) != frames.end();
    });
  }
  /// As another process sees it, once that is not older than the question.
  ClientShares shown() {
    std::optional<ClientShares> found;
    for (std::uint64_t cookie = 1; !found || found->bytes != memory.total(); ++cookie) {
      if (!other->send(bareFrame(FrameKind::barrier, cookie))) break;
      if (!isBarrierAnswered("4/" + std::to_string(cookie) + "/0")) break;
      found = readClientShares(shares);
    }
    return found.value_or(ClientShares{});
  }

  const std::string shares = directory / "clients/shares";
  const std::string text = std::string(4000, 'x');
  MemoryLedger memory{{.session = 1U << 30U, .peer = 3U << 20U, .total = 1U << 30U}};
  MemoryHold hold = memory.makeHold();
  std::size_t arrived = 0;
  std::string flood;
  std::optional<TestClient> flooding, other;  // once there is somebody to connect to
  std::thread sender;
};

TEST_F(ClientMemoryTest, AClientOverItsShareWaitsAloneAndLosesNothing) {
  beginFlood();
  ASSERT_TRUE(runUntil([this] { return hold.bytes() > memory.limits().peer; }));
  ASSERT_TRUE(other->send(requestFrame(kOther, "me")));
  ASSERT_TRUE(runUntil([this] { return events.back() == "2:me"; }));
  EXPECT_LT(arrived, kMessages);
  // Room again and again: it comes in pieces of a read, all of it and in order.
  ASSERT_TRUE(runUntil([this] {
    if (hold.bytes() > memory.limits().peer) hold.release(hold.bytes());
    return arrived == kMessages;
  }));
}

TEST_F(ClientMemoryTest, WhoWaitsIsReadAllTheSameNowAndThen) {
  beginFlood();
  ASSERT_TRUE(runUntil([this] { return hold.bytes() > memory.limits().peer; }));
  const std::size_t before = arrived;
  ASSERT_TRUE(runUntil([&] { return arrived > before; }));
  EXPECT_LT(arrived, kMessages);
}

TEST_F(ClientMemoryTest, OthersAreShownWhoWaitsAndHowMuchWasDelayed) {
  beginFlood();
  ASSERT_TRUE(runUntil([this] { return hold.bytes() > memory.limits().peer; }));
  ClientShares now = shown();
  EXPECT_EQ(now.agent, ::getpid());
  ASSERT_EQ(now.clients.size(), 2U);
  const auto flooder = [&] {
    return *std::max_element(now.clients.begin(), now.clients.end(),
                             [](const auto& a, const auto& b) { return a.bytes < b.bytes; });
  };
  EXPECT_EQ(flooder().process, ::getpid());
  EXPECT_EQ(flooder().user, ::getuid());
  EXPECT_EQ(flooder().bytes, hold.bytes());
  EXPECT_TRUE(flooder().isWaiting);
  ASSERT_TRUE(runUntil([this] {
    if (hold.bytes() > memory.limits().peer) hold.release(hold.bytes());
    return arrived == kMessages;
  }));
  ASSERT_TRUE(runUntil([this] { return readClientShares(shares).has_value(); }));
  hold.add(1U << 20U);
  now = shown();
  EXPECT_GT(flooder().delayedMessages + now.clients.front().delayedMessages, 0U);
  EXPECT_FALSE(now.clients.front().isWaiting);
}

TEST_F(ClientMemoryTest, NothingIsShownOfAClientThatHasLittle) {
  ASSERT_TRUE(other->send(requestFrame(kOther, "me") + bareFrame(FrameKind::barrier, 5)));
  ASSERT_TRUE(isBarrierAnswered("4/5/0"));
  EXPECT_EQ(readClientShares(shares), std::nullopt);
}

TEST(ClientSharesTest, ReadBackAsTheyWereWritten) {
  const testing::TemporaryDirectory directory;
  const ClientShares shares{7, 300, {{8, 1000, 200, 3, true}, {9, 0, 100, 0, false}}};
  testing::writeFile(directory / "shares", clientSharesText(shares));
  EXPECT_EQ(readClientShares(directory / "shares"), shares);
  testing::writeFile(directory / "shares", "agent 7 300\nclient 8 1000 200");
  EXPECT_EQ(readClientShares(directory / "shares"), std::nullopt);
}

}  // namespace
}  // namespace zal
