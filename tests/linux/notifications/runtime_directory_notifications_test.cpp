#include "platform/linux/notifications/runtime_directory_notifications.h"

#include <sys/stat.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/linux/loop/linux_run_loop.h"
#include "platform/linux/notifications/notification_file.h"
#include "tests/linux/loop/run_until.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class RuntimeDirectoryNotificationsTest : public ::testing::Test {
 protected:
  void observe(const std::string& name) {
    notifications.observe(name, [this, name] { delivered.push_back(name); });
  }
  /// Posts the mark and lets the loop run until it came: all that was posted before is delivered too.
  void settle() {
    const TimerId limit = loop.callAfter(180s, [this] {
      ADD_FAILURE() << "the mark was not delivered";
      loop.stop();
    });
    marked = false;
    loop.post([this] { notifications.post("Mark"); });
    loop.run();
    loop.cancel(limit);
  }
  void runUntil(const std::function<bool()>& condition) { testing::runUntil(loop, condition); }

  testing::TemporaryDirectory root;
  const std::string directory = notificationDirectory(root / "run");
  testing::RecordingAgentLog log;
  std::vector<std::string> delivered;
  bool marked = false;
  LinuxRunLoop loop;
  RuntimeDirectoryNotifications notifications{loop.context(), directory, log};

  void SetUp() override {
    notifications.observe("Mark", [this] {
      marked = true;
      loop.stop();
    });
  }
};

TEST_F(RuntimeDirectoryNotificationsTest, APostReachesItsObserversOnly) {
  observe("One");
  observe("Two");
  observe("One");
  notifications.post("One");
  EXPECT_THAT(delivered, IsEmpty());
  settle();
  EXPECT_THAT(delivered, ElementsAre("One", "One"));
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(RuntimeDirectoryNotificationsTest, EachPostOfTheSameNameIsAnEventOfItsOwn) {
  observe("One");
  for (int i = 0; i < 3; ++i) {
    EXPECT_EQ(postNotification(directory, "One"), std::error_code{});
    settle();
  }
  EXPECT_THAT(delivered, ElementsAre("One", "One", "One"));
}

TEST_F(RuntimeDirectoryNotificationsTest, ThreePostsAtOnceAreThree) {
  observe("One");
  for (int i = 0; i < 3; ++i) notifications.post("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One", "One", "One"));
}

TEST_F(RuntimeDirectoryNotificationsTest, EachPostArrivesWithItsOwnIdHoweverFastTheyCome) {
  std::vector<std::string> ids;
  notifications.observePosts("One", [&](std::string_view id) { ids.emplace_back(id); });
  notifications.postWithId("One", "a1");
  EXPECT_EQ(postNotification(directory, "One"), std::error_code{});
  notifications.postWithId("One", "B2");
  settle();
  EXPECT_THAT(ids, ElementsAre("a1", "", "B2"));
  EXPECT_EQ(testing::listTree(directory), "Mark\nOne\n");
}

TEST_F(RuntimeDirectoryNotificationsTest, IdsThatAreNoneAreRefusedAndNotRead) {
  std::vector<std::string> ids;
  notifications.observePosts("One", [&](std::string_view id) { ids.emplace_back(id); });
  for (const std::string id : {"a b", "../a", "a/b", "a-b"}) {
    EXPECT_EQ(postNotification(directory, "One", id), std::make_error_code(std::errc::invalid_argument));
  }
  EXPECT_EQ(postNotification(directory, "One", std::string(65, 'a')),
            std::make_error_code(std::errc::invalid_argument));
  testing::writeFile(directory + "/.post-a b", "");
  std::filesystem::rename(directory + "/.post-a b", directory + "/One");
  settle();
  EXPECT_THAT(ids, ElementsAre(""));
}

TEST_F(RuntimeDirectoryNotificationsTest, LeavesNoTemporaryFile) {
  notifications.post("One");
  settle();
  EXPECT_EQ(testing::listTree(directory), "Mark\nOne\n");
}

TEST_F(RuntimeDirectoryNotificationsTest, TheDirectoryIsForItsOwnerAlone) {
  struct stat status {};
  ASSERT_EQ(::stat(directory.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777U, 0700U);
}

TEST_F(RuntimeDirectoryNotificationsTest, WhatWasPostedBeforeIsNotDelivered) {
  EXPECT_EQ(postNotification(directory, "Old"), std::error_code{});
  settle();
  RuntimeDirectoryNotifications later(loop.context(), directory, log);
  later.observe("Old", [this] { delivered.push_back("Old"); });
  settle();
  EXPECT_THAT(delivered, IsEmpty());
}

TEST_F(RuntimeDirectoryNotificationsTest, HostileNamesAreRefusedWithAWarning) {
  for (const char* name : {"", ".", "..", "a/b", "../One", "/One", "a\nb", ".post-1-1"})
    notifications.post(name);
  notifications.post(std::string(201, 'x'));
  EXPECT_EQ(testing::listTree(root.path()), "run/\nrun/notifications/\n");
  ASSERT_EQ(log.lines.size(), 9U);
  EXPECT_EQ(log.lines[3],
            "warning: notification \"a/b\" was not posted in " + directory + ": Invalid argument");
  EXPECT_EQ(postNotification(directory, "../One"), std::make_error_code(std::errc::invalid_argument));
  notifications.post(std::string(200, 'x'));
  EXPECT_EQ(log.lines.size(), 9U);
}

TEST_F(RuntimeDirectoryNotificationsTest, ADirectoryThatIsRemovedComesBackWithItsWatch) {
  observe("One");
  std::filesystem::remove_all(root / "run");
  runUntil([&] { return std::filesystem::is_directory(directory); });
  notifications.post("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One"));
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(RuntimeDirectoryNotificationsTest, ALinkInThePlaceOfTheDirectoryIsNotUsed) {
  const std::string planted = root / "planted";
  std::filesystem::create_directories(root / "elsewhere");
  std::filesystem::create_directory_symlink("elsewhere", planted);
  EXPECT_EQ(postNotification(planted, "One"), std::errc::not_a_directory);
  EXPECT_TRUE(std::filesystem::is_empty(root / "elsewhere"));
}

TEST_F(RuntimeDirectoryNotificationsTest, ADirectoryThatIsMovedAwayIsMadeAgain) {
  observe("One");
  std::filesystem::rename(root / "run", root / "old");
  runUntil([&] { return std::filesystem::is_directory(directory); });
  EXPECT_EQ(postNotification(notificationDirectory(root / "old"), "One"), std::error_code{});
  settle();
  EXPECT_THAT(delivered, IsEmpty());
  notifications.post("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One"));
}

TEST_F(RuntimeDirectoryNotificationsTest, APostIntoADirectoryThatJustCameBackIsSeen) {
  observe("One");
  std::filesystem::remove_all(root / "run");
  EXPECT_EQ(postNotification(directory, "One"), std::error_code{});
  runUntil([&] { return !delivered.empty(); });
  EXPECT_THAT(delivered, ElementsAre("One"));
}

TEST_F(RuntimeDirectoryNotificationsTest, WhereTheDirectoryCannotBeMadeItWaitsForAChangeAbove) {
  observe("One");
  std::filesystem::remove_all(root / "run");
  testing::writeFile(root / "run", "in the way");
  runUntil([&] { return !log.lines.empty(); });
  EXPECT_THAT(log.lines, ElementsAre("warning: " + directory + ": cannot be watched: Not a directory"));
  testing::writeFile(root / "unrelated", "");
  std::filesystem::remove(root / "run");
  runUntil([&] { return std::filesystem::is_directory(directory); });
  notifications.post("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One"));
  EXPECT_EQ(log.lines.size(), 1U);
}

TEST_F(RuntimeDirectoryNotificationsTest, AnOverflowOfTheQueueCallsEveryObserver) {
  observe("One");
  observe("Two");
  std::size_t limit = 0;
  std::ifstream("/proc/sys/fs/inotify/max_queued_events") >> limit;
  ASSERT_GT(limit, 0U);
  if (limit > 200'000) GTEST_SKIP() << "the kernel's queue is too long to be filled: " << limit;
  // Alternating names, since the kernel folds equal events that follow each other.
  testing::writeFile(directory + "/.a", "");
  for (std::size_t i = 0; i <= limit; ++i) {
    const std::string from = directory + (i % 2 == 0 ? "/.a" : "/.b");
    const std::string to = directory + (i % 2 == 0 ? "/.b" : "/.a");
    std::filesystem::rename(from, to);
  }
  runUntil([&] { return !delivered.empty(); });
  EXPECT_THAT(delivered, ElementsAre("One", "Two"));
}

TEST_F(RuntimeDirectoryNotificationsTest, AHandlerMayObserveMore) {
  notifications.observe("One", [this] { observe("One"); });
  notifications.post("One");
  settle();
  EXPECT_THAT(delivered, IsEmpty());
  notifications.post("One");
  settle();
  EXPECT_THAT(delivered, ElementsAre("One"));
}

TEST_F(RuntimeDirectoryNotificationsTest, AServiceMayEndWhileAPostIsOnItsWay) {
  auto shortLived = std::make_unique<RuntimeDirectoryNotifications>(loop.context(), directory, log);
  shortLived->observe("One", [this] { delivered.push_back("One"); });
  notifications.post("One");
  shortLived.reset();
  settle();
  EXPECT_THAT(delivered, IsEmpty());
}

}  // namespace
}  // namespace zal
