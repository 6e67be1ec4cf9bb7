#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "platform/linux/loop/linux_work_queues.h"
#include "tests/linux/loop/run_loop_hosts.h"
#include "tests/support/manual_work_queues.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

struct ManualQueuesHost {
  ManualHost host;
  ManualWorkQueues realQueues{host.runLoop};
  WorkQueues& queues = realQueues;
  /// Lets that time pass and runs what became due.
  void settle(std::chrono::nanoseconds duration, const std::function<bool()>& /*done*/) {
    realQueues.runAll();
    host.runFor(duration);
    realQueues.runAll();
  }
};

struct LinuxQueuesHost {
  LinuxHost host;
  LinuxWorkQueues realQueues{host.loop, [](std::string_view) {}};
  WorkQueues& queues = realQueues;
  /// Runs the main loop until the condition holds; gives up after a minute: at the
  /// lowest priority a busy machine keeps a job waiting.
  void settle(std::chrono::nanoseconds /*duration*/, const std::function<bool()>& done) {
    const SteadyTime limit = host.clock.steadyNow() + 60s;
    while (!done() && host.clock.steadyNow() < limit) host.runFor(1ms);
    EXPECT_TRUE(done());
  }
};

/// What the queues promise, whoever runs them.
template <class Host>
class WorkQueueContractTest : public ::testing::Test {
 protected:
  WorkQueue::Job note(char name) {
    return [this, name] {
      const std::scoped_lock lock(mutex);
      trace += name;
    };
  }
  std::string seen() {
    const std::scoped_lock lock(mutex);
    return trace;
  }
  void settleUntil(const std::string& expected, std::chrono::nanoseconds duration = 0ns) {
    host.settle(duration, [&] { return seen() == expected; });
    EXPECT_EQ(seen(), expected);
  }
  std::mutex mutex;
  std::string trace;
  Host host;
};

using QueueHosts = ::testing::Types<ManualQueuesHost, LinuxQueuesHost>;
TYPED_TEST_SUITE(WorkQueueContractTest, QueueHosts);

TYPED_TEST(WorkQueueContractTest, ASerialQueueKeepsTheOrderOfItsJobs) {
  const auto queue = this->host.queues.makeSerial("letters", QueuePriority::standard);
  std::string expected;
  for (char name = 'a'; name <= 'z'; ++name) {
    queue->async(this->note(name));
    expected += name;
  }
  this->settleUntil(expected);
}

TYPED_TEST(WorkQueueContractTest, JobsOfASerialQueueNeverOverlap) {
  const auto queue = this->host.queues.makeSerial("one at a time", QueuePriority::background);
  std::atomic<int> inside = 0, overlaps = 0, finished = 0;
  for (int i = 0; i < 500; ++i) {
    queue->async([&] {
      if (++inside != 1) ++overlaps;
      --inside;
      ++finished;
    });
  }
  this->host.settle(0ns, [&] { return finished == 500; });
  EXPECT_EQ(overlaps, 0);
}

TYPED_TEST(WorkQueueContractTest, AnAcceptedJobRunsWhenTheQueueObjectIsGone) {
  auto queue = this->host.queues.makeSerial("gone", QueuePriority::standard);
  queue->async(this->note('a'));
  queue->async(this->note('b'));
  queue.reset();
  this->settleUntil("ab");
}

TYPED_TEST(WorkQueueContractTest, ADelayedJobRunsWhenTheQueueObjectIsGone) {
  auto queue = this->host.queues.makeSerial("gone", QueuePriority::standard);
  queue->asyncAfter(5ms, this->note('a'));
  queue.reset();
  this->settleUntil("a", 5ms);
}

TYPED_TEST(WorkQueueContractTest, DelayedJobsRunNoEarlierThanTheirDelay) {
  for (WorkQueue* queue : {&this->host.queues.main(), &this->host.queues.global(QueuePriority::standard),
                           &this->host.queues.global(QueuePriority::background)}) {
    const SteadyTime start = this->host.host.clock.steadyNow();
    std::atomic<bool> done = false;
    SteadyTime ran{};
    queue->asyncAfter(10ms, [&] {
      ran = this->host.host.clock.steadyNow();
      done = true;
    });
    this->host.settle(10ms, [&] { return done.load(); });
    EXPECT_GE(ran - start, 10ms) << queue->label();
  }
}

TYPED_TEST(WorkQueueContractTest, DelaysHoldUpNeitherEachOtherNorOtherJobs) {
  WorkQueue& queue = this->host.queues.global(QueuePriority::background);
  for (int i = 0; i < 50; ++i) queue.asyncAfter(1h, this->note('x'));
  queue.async(this->note('a'));
  this->settleUntil("a");
}

TYPED_TEST(WorkQueueContractTest, TheMainQueueRunsOnTheLoopInOrder) {
  std::thread::id where;
  this->host.queues.main().async([&] { where = std::this_thread::get_id(); });
  this->host.queues.main().async(this->note('a'));
  EXPECT_EQ(this->seen(), "");
  this->settleUntil("a");
  EXPECT_EQ(where, std::this_thread::get_id());
}

TYPED_TEST(WorkQueueContractTest, AJobMayHandItsResultToTheMainQueue) {
  WorkQueue& main = this->host.queues.main();
  this->host.queues.global(QueuePriority::background).async([&] { main.async(this->note('a')); });
  this->settleUntil("a");
}

TYPED_TEST(WorkQueueContractTest, AJobMayGiveItsOwnQueueTheNext) {
  const auto queue = this->host.queues.makeSerial("chain", QueuePriority::standard);
  queue->async([&] {
    this->note('a')();
    queue->async(this->note('b'));
  });
  this->settleUntil("ab");
}

TYPED_TEST(WorkQueueContractTest, QueuesAreCalledByTheirLabels) {
  EXPECT_EQ(this->host.queues.main().label(), "main");
  EXPECT_EQ(this->host.queues.global(QueuePriority::standard).label(), "global.default");
  EXPECT_EQ(this->host.queues.global(QueuePriority::background).label(), "global.background");
  EXPECT_EQ(this->host.queues.makeSerial("mine", QueuePriority::standard)->label(), "mine");
}

}  // namespace
}  // namespace zal::testing
