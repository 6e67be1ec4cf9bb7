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

TEST(ManualRunLoopTest, AMomentPutTogetherAgainIsTheSame) {
  ManualRunLoop loop;
  for (const auto offset : {0h, 2h, -11h}) {
    loop.zoneOffset = offset;
    const WallTime moment{1714651387251ms};
    EXPECT_EQ(loop.momentOf(loop.localTime(moment)), moment);
  }
}

TEST(ManualRunLoopTest, TheLocalTimeIsTwoHoursAheadUnlessATestSetsAnother) {
  ManualRunLoop loop;
  EXPECT_EQ(loop.momentOf({2024, 5, 2, 14, 3, 7, 251}), WallTime{1714651387251ms});
  loop.zoneOffset = -5h;
  EXPECT_EQ(loop.momentOf({2024, 5, 2, 7, 3, 7, 251}), WallTime{1714651387251ms});
}

TEST(ManualRunLoopTest, ThereIsNoMomentForAnImpossibleDateOrTime) {
  const ManualRunLoop loop;
  for (const LocalTime& time : {LocalTime{2023, 2, 29, 12, 0, 0, 0}, LocalTime{2024, 13, 1, 12, 0, 0, 0},
                                LocalTime{2024, 1, 1, 24, 0, 0, 0}, LocalTime{2024, 1, 1, 12, 60, 0, 0}}) {
    EXPECT_EQ(loop.momentOf(time), std::nullopt);
  }
}

TEST(ManualRunLoopTest, AfterASleepWhatFellDueFiresOnceAndTheGridStays) {
  ManualRunLoop loop;
  const SteadyTime start = loop.steadyNow();
  std::vector<std::chrono::nanoseconds> fired;
  const auto note = [&] { fired.push_back(loop.steadyNow() - start); };
  loop.callEvery(5s, note);
  loop.callAfter(6s, note);
  loop.sleep(62s);
  loop.advance(3s);
  EXPECT_EQ(fired, (std::vector<std::chrono::nanoseconds>{62s, 62s, 65s}));
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
