#include "platform/linux/bus_module/two_road_notifications.h"

#include <gmock/gmock.h>

#include "platform/linux/notifications/notification_file.h"
#include "tests/linux/bus/bus_fixture.h"

namespace zal::testing {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

/// The real module on a real bus, and a real runtime directory.
class TwoRoadNotificationsTest : public BusFixture {
 protected:
  static constexpr int kMostTries = 200;

  TemporaryDirectory root;
  const std::string directory = notificationDirectory(root / "run");
  RuntimeDirectoryNotifications files{loop.context(), directory, log};
  BusModule module{host, ZAL_BUS_MODULE};
  TwoRoadNotifications notifications{files, module};
  std::vector<std::string> delivered;

  void observe(const std::string& name) {
    notifications.observe(name, [this, name] { delivered.push_back(name); });
  }
  void emit(const std::string& member, const std::vector<std::string>& arguments = {}) const {
    std::vector<std::string> words{"emit", "/com/vendel/lirra", "com.vendel.Lirra", member};
    words.insert(words.end(), arguments.begin(), arguments.end());
    EXPECT_EQ(bus.busctl(words), "");
  }
  /// Uses the bus, and returns when what was observed before is heard from it.
  void useBus() {
    module.loadSoon();
    awaitBus();
  }
  void awaitBus() { EXPECT_TRUE(_hearSignal("Ready")); }
  /// Everything posted before is delivered, by both roads.
  void settle() {
    const auto isSeen = _observeMark("File");
    EXPECT_EQ(postNotification(directory, "File" + std::to_string(_marks)), std::error_code{});
    EXPECT_TRUE(runUntil([&] { return *isSeen; }));
    const bool hasBus = module.loaded() != nullptr && bus.isRunning();
    EXPECT_TRUE(!hasBus || _hearSignal("Bus"));
  }

 private:
  /// Shared, since a mark may be heard again later.
  std::shared_ptr<bool> _observeMark(const std::string& name) {
    const auto isThere = std::make_shared<bool>(false);
    notifications.observe(name + std::to_string(++_marks), [isThere] { *isThere = true; });
    return isThere;
  }
  bool _hearSignal(const std::string& name) {
    const auto isHeard = _observeMark(name);
    const std::string mark = name + std::to_string(_marks);
    for (int i = 0; i < kMostTries && !*isHeard; ++i) {
      emit(mark);
      runFor(std::chrono::milliseconds(20));
    }
    return *isHeard;
  }

  int _marks = 0;
};

TEST_F(TwoRoadNotificationsTest, APostTakesBothRoadsAndIsDeliveredOnce) {
  observe("One");
  useBus();
  notifications.post("One");
  EXPECT_THAT(delivered, IsEmpty()) << "never inside post()";
  settle();
  EXPECT_THAT(delivered, ElementsAre("One"));
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(TwoRoadNotificationsTest, ThreePostsAtOnceAreThreeDeliveries) {
  observe("One");
  useBus();
  for (int i = 0; i < 3; ++i) notifications.post("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One", "One", "One"));
}

TEST_F(TwoRoadNotificationsTest, APostReachesEveryObserverOfItsNameOnly) {
  observe("One");
  observe("One");
  observe("Two");
  useBus();
  notifications.post("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One", "One"));
}

TEST_F(TwoRoadNotificationsTest, AnothersSignalAloneIsDelivered) {
  observe("kLirraSyncLoggingPrefs");
  useBus();
  emit("kLirraSyncLoggingPrefs");
  emit("kLirraSyncLoggingPrefs");
  settle();
  EXPECT_THAT(delivered, ElementsAre("kLirraSyncLoggingPrefs", "kLirraSyncLoggingPrefs"));
}

TEST_F(TwoRoadNotificationsTest, AnothersFileAloneIsDeliveredAlsoAmongOurOwnPosts) {
  observe("One");
  useBus();
  EXPECT_EQ(postNotification(directory, "One"), std::error_code{});
  notifications.post("One");
  EXPECT_EQ(postNotification(directory, "One"), std::error_code{});
  settle();
  EXPECT_THAT(delivered, ElementsAre("One", "One", "One"));
}

TEST_F(TwoRoadNotificationsTest, AnotherWhoTakesBothRoadsUnderOneIdIsDeliveredOnce) {
  observe("One");
  useBus();
  emit("One", {"s", "abc1"});
  EXPECT_EQ(postNotification(directory, "One", "abc1"), std::error_code{});
  settle();
  EXPECT_THAT(delivered, ElementsAre("One"));
}

TEST_F(TwoRoadNotificationsTest, WhateverElseASignalCarriesIsNoId) {
  observe("One");
  useBus();
  emit("One", {"u", "7"});
  emit("One", {"s", "no id"});
  emit("One", {"as", "1", "x"});
  settle();
  EXPECT_THAT(delivered, ElementsAre("One", "One", "One"));
}

TEST_F(TwoRoadNotificationsTest, SignalsOfOtherObjectsAndInterfacesAreNotOurs) {
  observe("One");
  useBus();
  EXPECT_EQ(bus.busctl({"emit", "/com/vendel/other", "com.vendel.Lirra", "One"}), "");
  EXPECT_EQ(bus.busctl({"emit", "/com/vendel/lirra", "com.vendel.Other", "One"}), "");
  settle();
  EXPECT_THAT(delivered, IsEmpty());
}

TEST_F(TwoRoadNotificationsTest, OurPostsAreSignalsThatOthersHear) {
  useBus();
  const std::string output = root / "monitor";
  ChildProgram monitor({.command = {"/usr/bin/env", "busctl", "--address=" + bus.address(), "--json=short",
                                    "monitor", "--match=type='signal',interface='com.vendel.Lirra'"},
                        .output = output,
                        .errors = root / "errors"});
  ASSERT_TRUE(eventually(
      [&] { return readFile(output + "").find("{") != std::string::npos || (emit("Probe"), false); }));
  notifications.post("LirraLoggingDumpComplete");
  EXPECT_TRUE(runUntil([&] {
    const std::string text = readFile(output);
    const std::size_t line = text.find("\"member\":\"LirraLoggingDumpComplete\"");
    return line != std::string::npos && text.find("\"payload\":{\"type\":\"s\"", line) != std::string::npos;
  }));
}

TEST_F(TwoRoadNotificationsTest, WithoutABusTheDirectoryGoesOnAloneAndTheBusIsHeardAgain) {
  observe("One");
  useBus();
  bus.kill();
  ASSERT_TRUE(runUntil([this] { return !log.lines.empty(); }));
  notifications.post("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One"));
  bus.start();
  awaitBus();
  emit("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One", "One"));
  notifications.post("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One", "One", "One"));
  EXPECT_EQ(log.lines.size(), 2U) << "lost, and back";
}

TEST_F(TwoRoadNotificationsTest, WithoutADirectoryTheBusGoesOnAlone) {
  observe("One");
  useBus();
  std::filesystem::remove_all(root / "run");
  writeFile(root / "run", "in the way");
  notifications.post("One");
  ASSERT_TRUE(runUntil([this] { return !delivered.empty(); }));
  EXPECT_THAT(delivered, ElementsAre("One"));
}

TEST_F(TwoRoadNotificationsTest, ABusThatHangsHoldsUpNoPost) {
  observe("One");
  useBus();
  bus.hang();
  EXPECT_EQ(strayWaitsDuring([this] {
              notifications.post("One");
              EXPECT_TRUE(runUntil([this] { return !delivered.empty(); }));
            }),
            0U);
  bus.goOn();
  settle();
  EXPECT_THAT(delivered, ElementsAre("One"));
}

TEST_F(TwoRoadNotificationsTest, NamesThatNoSignalCanHaveGoByTheDirectoryAlone) {
  observe("with blank.and-more");
  useBus();
  notifications.post("with blank.and-more");
  settle();
  EXPECT_THAT(delivered, ElementsAre("with blank.and-more"));
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(TwoRoadNotificationsTest, AHandlerMayObserveMoreWhichIsHeardFromTheBusToo) {
  useBus();
  notifications.observe("One", [this] { observe("Two"); });
  notifications.post("One");
  settle();
  awaitBus();
  emit("Two");
  settle();
  EXPECT_THAT(delivered, ElementsAre("Two"));
}

TEST_F(TwoRoadNotificationsTest, SwitchedOffInTheConfigurationNothingIsLoaded) {
  configuration.bus.enabled = false;
  observe("One");
  module.loadSoon();
  notifications.post("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One"));
  EXPECT_EQ(module.services(), nullptr);
}

TEST_F(TwoRoadNotificationsTest, AModuleThatIsNotThereIsSaidOnce) {
  BusModule missing(host, root / "lirra-bus.so");
  missing.loadSoon();
  ASSERT_TRUE(runUntil([this] { return !log.lines.empty(); }));
  EXPECT_EQ(missing.services(), nullptr);
  ASSERT_EQ(log.lines.size(), 1U);
  EXPECT_TRUE(log.lines[0].starts_with("warning: Without the services of the bus: ")) << log.lines[0];
}

TEST_F(TwoRoadNotificationsTest, AQueueThreadThatIsTheFirstHasTheMainThreadMakeTheServices) {
  std::atomic<BusServices*> found = nullptr;
  queues.global(QueuePriority::background).async([&] { found = module.services(); });
  ASSERT_TRUE(runUntil([&] { return found != nullptr; }));
  EXPECT_EQ(found, module.loaded());
}

}  // namespace
}  // namespace zal::testing
