#include "platform/local_notifications.h"

#include <gtest/gtest.h>

#include <vector>

namespace zal {
namespace {

TEST(LocalNotificationsTest, DeliversToObserversOfThatNameInOrder) {
  LocalNotifications notifications;
  std::vector<int> calls;
  int object = 7;
  notifications.observe("A", [&](void* given) { calls.push_back(*static_cast<int*>(given)); });
  notifications.observe("A", [&](void*) { calls.push_back(2); });
  notifications.observe("B", [&](void*) { calls.push_back(3); });
  notifications.post("A", &object);
  EXPECT_EQ(calls, (std::vector{7, 2}));
}

TEST(LocalNotificationsTest, AnObserverMayRemoveItselfAndTheNextWhileItRuns) {
  LocalNotifications notifications;
  int first = 0;
  int second = 0;
  LocalNotifications::ObserverId firstId = 0;
  LocalNotifications::ObserverId secondId = 0;
  firstId = notifications.observe("A", [&](void*) {
    ++first;
    notifications.removeObserver(firstId);
    notifications.removeObserver(secondId);
  });
  secondId = notifications.observe("A", [&](void*) { ++second; });
  notifications.post("A", nullptr);
  notifications.post("A", nullptr);
  EXPECT_EQ(first, 1);
  EXPECT_EQ(second, 0);
}

}  // namespace
}  // namespace zal
