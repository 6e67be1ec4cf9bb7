#include "tests/support/manual_run_loop.h"

#include <gtest/gtest.h>

#include "tests/support/manual_work_queues.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

TEST(ManualRunLoopTest, FiresTimersInDeadlineOrderAtTheirOwnInstant) {
  ManualRunLoop loop;
  const SteadyTime start = loop.steadyNow();
  std::vector<std::pair<char, std::chrono::nanoseconds>> fired;
  auto note = [&](char name) { return [&, name] { fired.emplace_back(name, loop.steadyNow() - start); }; };
  loop.callAfter(2s, note('b'));
  loop.callAfter(1s, [&] {
    note('a')();
    loop.callAfter(1s, note('c'));
  });
  loop.advance(1999ms);
  EXPECT_EQ(fired.size(), 1U);
  loop.advance(1ms);
  EXPECT_EQ(fired, (decltype(fired){{'a', 1s}, {'b', 2s}, {'c', 2s}}));
  EXPECT_EQ(loop.pendingTimers(), 0U);
}

TEST(ManualRunLoopTest, ARepeatingTimerMayCancelItself) {
  ManualRunLoop loop;
  int beats = 0;
  TimerId timer{};
  timer = loop.callEvery(5s, [&] {
    if (++beats == 2) loop.cancel(timer);
  });
  loop.advance(60s);
  EXPECT_EQ(beats, 2);
}

TEST(ManualWorkQueuesTest, TheTestChoosesWhichQueueRunsNext) {
  ManualRunLoop loop;
  ManualWorkQueues queues(loop);
  auto serial = queues.makeSerial("one", QueuePriority::standard);
  std::string order;
  serial->async([&] { order += 's'; });
  queues.global(QueuePriority::background).async([&] { order += 'b'; });
  queues.main().async([&] { order += 'm'; });
  EXPECT_TRUE(queues.runNext("global.background"));
  EXPECT_TRUE(queues.runNext("one"));
  EXPECT_FALSE(queues.runNext("one"));
  queues.runAll();
  EXPECT_EQ(order, "bsm");
}

}  // namespace
}  // namespace zal::testing
