#include "platform/linux/bus/bus_connection.h"

#include "tests/linux/bus/bus_fixture.h"

namespace zal::testing {
namespace {

using Lines = std::vector<std::string>;

/// One user that notes what happens to it.
class BusConnectionTest : public BusFixture {
 protected:
  BusConnection connection{host, host.systemBus, "system bus"};
  Lines events;
  std::unique_ptr<sdbus::IProxy> proxy;
  std::unique_ptr<BusConnection::User> user;

  void join() {
    user = connection.addUser({.onConnected =
                                   [this](sdbus::IConnection& at) {
                                     events.emplace_back("connected");
                                     proxy = sdbus::createProxy(at, "com.example.Sleeper", "/");
                                   },
                               .onLost =
                                   [this] {
                                     events.emplace_back("lost");
                                     proxy.reset();
                                   }});
  }
  void askOwner() {
    proxy->callMethodAsync("Ping")
        .onInterface("org.freedesktop.DBus.Peer")
        .withTimeout(std::chrono::milliseconds(200))
        .uponReplyInvoke([this](const sdbus::Error* error) {
          events.push_back(error != nullptr ? error->getName() : "answer");
        });
  }
};

TEST_F(BusConnectionTest, NothingIsConnectedBeforeSomebodyWantsIt) {
  runFor(std::chrono::milliseconds(50));
  EXPECT_EQ(bus.busctl({"list", "--unique", "--no-legend", "--no-pager"}).find("bus_tests"),
            std::string::npos);
}

TEST_F(BusConnectionTest, IsMadeForItsFirstUserAndAnswersAsynchronously) {
  join();
  EXPECT_EQ(events, Lines{});
  ASSERT_TRUE(runUntil([this] { return !events.empty(); }));
  askOwner();
  EXPECT_TRUE(runUntil([this] { return events.size() == 2; }));
  EXPECT_EQ(events, (Lines{"connected", "org.freedesktop.DBus.Error.ServiceUnknown"}));
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(BusConnectionTest, ABusThatDiesIsSaidOnceAndPickedUpAgain) {
  join();
  ASSERT_TRUE(runUntil([this] { return !events.empty(); }));
  bus.kill();
  ASSERT_TRUE(runUntil([this] { return events.size() == 2; }));
  runFor(std::chrono::milliseconds(800));
  EXPECT_EQ(connection.connection(), nullptr);
  bus.start();
  ASSERT_TRUE(runUntil([this] { return events.size() == 3; }));
  EXPECT_EQ(events, (Lines{"connected", "lost", "connected"}));
  ASSERT_EQ(log.lines.size(), 2U);
  EXPECT_TRUE(log.lines[0].starts_with("warning: The system bus is lost: ")) << log.lines[0];
  EXPECT_EQ(log.lines[1], "notice: The system bus is back");
}

TEST_F(BusConnectionTest, ABusThatHangsHoldsUpNobodyAndCallsRunIntoTheirLimit) {
  join();
  ASSERT_TRUE(runUntil([this] { return !events.empty(); }));
  bus.hang();
  EXPECT_EQ(strayWaitsDuring([this] {
              askOwner();
              EXPECT_TRUE(runUntil([this] { return events.size() == 2; }));
            }),
            0U);
  EXPECT_EQ(events.back(), "org.freedesktop.DBus.Error.NoReply");
  bus.goOn();
}

TEST_F(BusConnectionTest, ABusThatTakesConnectionsAndSaysNothingIsSaidOnceAndPickedUpWhenItSpeaks) {
  bus.hang();
  join();
  ASSERT_TRUE(runUntil([this] { return !log.lines.empty(); }));
  bus.goOn();
  ASSERT_TRUE(runUntil([this] { return !events.empty(); }));
  EXPECT_EQ(events, Lines{"connected"});
  ASSERT_EQ(log.lines.size(), 2U);
  EXPECT_TRUE(log.lines[0].starts_with("warning: The system bus cannot be reached: ")) << log.lines[0];
  EXPECT_EQ(log.lines[1], "notice: The system bus is back");
}

TEST_F(BusConnectionTest, ABusThatIsNotThereCostsNoTimerAndComesWithALaterWish) {
  bus.kill();
  join();
  runFor(std::chrono::milliseconds(50));
  EXPECT_EQ(events, Lines{});
  EXPECT_EQ(log.lines, Lines{});
  bus.start();
  EXPECT_TRUE(runUntil([this] { return connection.connection() != nullptr; }));
  EXPECT_EQ(events, Lines{"connected"});
}

/// A user that notes which signals of com.example.Bell reach it.
class BusConnectionSignalsTest : public BusConnectionTest {
 protected:
  static constexpr const char* kOne = "type='signal',interface='com.example.Bell',member='One'";
  Lines heard;
  std::unique_ptr<BusConnection::User> listener;

  void joinListening() {
    listener = connection.addUser(
        {.onConnected =
             [this](sdbus::IConnection&) {
               events.emplace_back("listening");
               connection.listen(kOne);
             },
         .signals = {{"type='signal',interface='com.example.Bell'",
                      [this](sdbus::Message& signal) { heard.push_back(signal.getMemberName()); }}}});
  }
  void ring(const std::string& member) const {
    EXPECT_EQ(bus.busctl({"emit", "/bell", "com.example.Bell", member}), "");
  }
  /// What this side asked of the bus is done, and what the bus sent before is here.
  void settle() {
    bool isAnswered = false;
    const auto daemon =
        sdbus::createProxy(*connection.connection(), "org.freedesktop.DBus", "/org/freedesktop/DBus");
    daemon->callMethodAsync("GetId")
        .onInterface("org.freedesktop.DBus")
        .withTimeout(std::chrono::seconds(5))
        .uponReplyInvoke([&](const sdbus::Error*, const std::string&) { isAnswered = true; });
    EXPECT_TRUE(runUntil([&] { return isAnswered; }));
  }
  bool runUntilHeard(std::size_t count) {
    return runUntil([this, count] { return heard.size() == count; });
  }
};

TEST_F(BusConnectionSignalsTest, OnlyWhatIsListenedForArrivesAndOnlyAsLongAsItIs) {
  joinListening();
  ASSERT_TRUE(runUntil([this] { return !events.empty(); }));
  settle();
  ring("Other");
  ring("One");
  ASSERT_TRUE(runUntilHeard(1));
  EXPECT_EQ(heard, Lines{"One"});
  connection.stopListening(kOne);
  settle();
  ring("One");
  settle();
  EXPECT_EQ(heard, Lines{"One"});
}

TEST_F(BusConnectionSignalsTest, SignalsArriveAgainAfterTheBusWasGone) {
  joinListening();
  ASSERT_TRUE(runUntil([this] { return !events.empty(); }));
  bus.kill();
  ASSERT_TRUE(runUntil([this] { return connection.connection() == nullptr; }));
  bus.start();
  ASSERT_TRUE(runUntil([this] { return events.size() == 2; }));
  settle();
  ring("One");
  EXPECT_TRUE(runUntilHeard(1));
}

TEST_F(BusConnectionSignalsTest, WhoWantsSignalsMayComeWhenTheConnectionIsThereAlready) {
  join();
  ASSERT_TRUE(runUntil([this] { return !events.empty(); }));
  joinListening();
  ASSERT_TRUE(runUntil([this] { return events.size() == 4; }));
  EXPECT_EQ(events, (Lines{"connected", "lost", "connected", "listening"}));
  settle();
  ring("One");
  EXPECT_TRUE(runUntilHeard(1));
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(BusConnectionSignalsTest, WhoWantsSignalsMayComeWhileTheConnectionIsBeingMade) {
  join();
  joinListening();
  ASSERT_TRUE(runUntil([this] { return events.size() == 2; }));
  EXPECT_EQ(events, (Lines{"connected", "listening"}));
  settle();
  ring("One");
  EXPECT_TRUE(runUntilHeard(1));
}

TEST_F(BusConnectionSignalsTest, AUserThatLeftHearsNothingMore) {
  joinListening();
  ASSERT_TRUE(runUntil([this] { return !events.empty(); }));
  settle();
  listener.reset();
  ring("One");
  settle();
  EXPECT_EQ(heard, Lines{});
}

TEST_F(BusConnectionTest, AUserThatLeftIsToldNothingMore) {
  join();
  ASSERT_TRUE(runUntil([this] { return !events.empty(); }));
  proxy.reset();
  user.reset();
  bus.kill();
  EXPECT_TRUE(runUntil([this] { return connection.connection() == nullptr; }));
  EXPECT_EQ(events, Lines{"connected"});
}

}  // namespace
}  // namespace zal::testing
