#include "platform/linux/loop/linux_work_queues.h"

#include <gtest/gtest.h>
#include <pthread.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <future>
#include <mutex>
#include <stdexcept>
#include <string>
#include <system_error>
#include <thread>
#include <vector>

#include "tests/support/failing_calls.h"
#include "tests/support/manual_run_loop.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

std::ptrdiff_t threadsNamed(const std::string& prefix) {
  std::ptrdiff_t count = 0;
  for (const auto& task : std::filesystem::directory_iterator("/proc/self/task")) {
    std::ifstream comm(task.path() / "comm");
    std::string name;
    std::getline(comm, name);
    if (name.starts_with(prefix)) ++count;
  }
  return count;
}

class LinuxWorkQueuesTest : public ::testing::Test {
 protected:
  void noteFailure(std::string_view line) {
    const std::scoped_lock lock(_mutex);
    failures.emplace_back(line);
  }
  /// Runs it on the queue and waits for its result.
  template <class Function>
  static auto on(WorkQueue& queue, Function function) {
    std::packaged_task<decltype(function())()> task(std::move(function));
    auto result = task.get_future();
    queue.async([&task] { task(); });
    auto value = result.get();
    return value;
  }
  /// The work, with so many threads that do not start; false where the host lets no call fail.
  [[nodiscard]] bool withoutThreads(int times, const std::function<void()>& work) {
    std::vector<FailingCall> failing = {{SYS_clone, EAGAIN, times}};
#ifdef SYS_clone3
    failing.push_back({SYS_clone3, EAGAIN, times});
#endif
    return withFailingCalls(failing, [&] {
      work();
      queues.reset();
    });
  }
  WorkQueue& standard() { return queues->global(QueuePriority::standard); }
  WorkQueue& background() { return queues->global(QueuePriority::background); }

  std::vector<std::string> failures;  // read after the queues are gone, or from their thread
  ManualRunLoop loop;
  std::unique_ptr<LinuxWorkQueues> queues =
      std::make_unique<LinuxWorkQueues>(loop, [this](std::string_view line) { noteFailure(line); });

 private:
  std::mutex _mutex;
};

TEST_F(LinuxWorkQueuesTest, ThreadsComeWithTheFirstJobOfTheirPool) {
  EXPECT_EQ(threadsNamed("zal-"), 0);
  on(standard(), [] { return 0; });
  EXPECT_EQ(threadsNamed("zal-work-"), 1);
  EXPECT_EQ(threadsNamed("zal-idle-"), 0);
  on(background(), [] { return 0; });
  EXPECT_EQ(threadsNamed("zal-idle-"), 1);
}

TEST_F(LinuxWorkQueuesTest, BackgroundThreadsAreNiceAndIdleForTheDisk) {
  struct Priority {
    int nice, ioClass;
  };
  const auto ask = [] {
    errno = 0;
    const int nice = ::getpriority(PRIO_PROCESS, static_cast<id_t>(::syscall(SYS_gettid)));
    return Priority{nice, static_cast<int>(::syscall(SYS_ioprio_get, 1, 0) >> 13)};
  };
  const Priority back = on(background(), ask), front = on(standard(), ask), here = ask();
  EXPECT_EQ(back.nice, 19);
  EXPECT_EQ(back.ioClass, 3);
  EXPECT_EQ(front.nice, here.nice);
  EXPECT_EQ(front.ioClass, here.ioClass);
  const auto serial = queues->makeSerial("serial", QueuePriority::background);
  EXPECT_EQ(on(*serial, ask).nice, 19);
}

TEST_F(LinuxWorkQueuesTest, PoolThreadsBlockEverySignal) {
  const bool blocked = on(standard(), [] {
    sigset_t mask;
    ::pthread_sigmask(SIG_BLOCK, nullptr, &mask);
    return ::sigismember(&mask, SIGTERM) == 1 && ::sigismember(&mask, SIGHUP) == 1 &&
           ::sigismember(&mask, SIGCHLD) == 1;
  });
  EXPECT_TRUE(blocked);
  sigset_t mask;
  ::pthread_sigmask(SIG_BLOCK, nullptr, &mask);
  EXPECT_EQ(::sigismember(&mask, SIGTERM), 0);
}

TEST_F(LinuxWorkQueuesTest, JobsOfAGlobalQueueRunSideBySide) {
  std::promise<void> second;
  auto waited = second.get_future();
  std::promise<void> done;
  standard().async([&] {
    waited.wait();  // goes on only if the other one runs meanwhile
    done.set_value();
  });
  standard().async([&] { second.set_value(); });
  EXPECT_EQ(done.get_future().wait_for(180s), std::future_status::ready);
}

TEST_F(LinuxWorkQueuesTest, ThreadsAreBounded) {
  std::atomic<int> finished = 0;
  for (int i = 0; i < 1000; ++i) {
    standard().async([&] {
      std::this_thread::yield();
      ++finished;
    });
  }
  EXPECT_LE(threadsNamed("zal-work-"), 4);
  queues.reset();
  EXPECT_EQ(finished, 1000);
}

TEST_F(LinuxWorkQueuesTest, AThreadThatDoesNotStartIsTriedAgain) {
  int answer = 0;
  if (!withoutThreads(2, [&] { answer = on(standard(), [] { return 7; }); }))
    GTEST_SKIP() << "the host lets no system call fail";
  EXPECT_EQ(answer, 7);
}

TEST_F(LinuxWorkQueuesTest, WithoutAnyThreadTheOwnerOfTheJobFailsAndTheNextOneTriesAgain) {
  const auto play = [&] {
    EXPECT_THROW(standard().async([] {}), std::system_error);
    EXPECT_EQ(on(standard(), [] { return 7; }), 7);
  };
  if (!withoutThreads(3, play)) GTEST_SKIP() << "the host lets no system call fail";
}

TEST_F(LinuxWorkQueuesTest, WhatAJobThrowsIsToldAndTheQueueGoesOn) {
  auto queue = queues->makeSerial("fragile", QueuePriority::standard);
  queue->async([] { throw std::runtime_error("disk is full"); });
  queue->async([] { throw 5; });
  EXPECT_EQ(on(*queue, [] { return 7; }), 7);
  queues.reset();
  EXPECT_EQ(failures, (std::vector<std::string>{
                          "A job on the queue fragile ended by an exception: disk is full",
                          "A job on the queue fragile ended by an exception of an unknown kind"}));
}

TEST_F(LinuxWorkQueuesTest, TheEndRunsWhatWasAcceptedAndWhatThatHandsOn) {
  std::atomic<int> ran = 0;
  auto serial = queues->makeSerial("serial", QueuePriority::background);
  WorkQueue& global = background();
  for (int i = 0; i < 100; ++i) {
    serial->async([&] {
      ++ran;
      global.async([&] { ++ran; });
    });
  }
  serial.reset();
  queues.reset();
  EXPECT_EQ(ran, 200);
}

TEST_F(LinuxWorkQueuesTest, TheEndDropsJobsWhoseDelayHasNotPassed) {
  auto alive = std::make_shared<std::atomic<int>>(0);
  for (int i = 0; i < 10; ++i) standard().asyncAfter(1h, [alive] { ++*alive; });
  queues.reset();
  EXPECT_EQ(*alive, 0);
  EXPECT_EQ(alive.use_count(), 1);
}

TEST_F(LinuxWorkQueuesTest, ASerialQueueMayOutliveTheQueues) {
  auto serial = queues->makeSerial("late", QueuePriority::standard);
  std::atomic<int> ran = 0;
  serial->async([&] { ++ran; });
  queues.reset();
  serial->async([&] { ++ran; });
  serial->asyncAfter(0ns, [&] { ++ran; });
  serial.reset();
  EXPECT_EQ(ran, 1);
}

TEST_F(LinuxWorkQueuesTest, SeveralThreadsMayUseThemAtOnce) {
  std::atomic<int> ran = 0;
  const auto serial = queues->makeSerial("serial", QueuePriority::standard);
  {
    std::vector<std::jthread> threads;
    for (int thread = 0; thread < 4; ++thread) {
      threads.emplace_back([&] {
        for (int i = 0; i < 200; ++i) {
          standard().async([&] { ++ran; });
          serial->async([&] { ++ran; });
          background().asyncAfter(1us, [&] { ++ran; });
          queues->main().async([&] { ++ran; });
          queues->makeSerial("short", QueuePriority::background)->async([&] { ++ran; });
        }
      });
    }
  }
  while (ran < 4 * 200 * 5) loop.drain();
  EXPECT_EQ(ran, 4000);
}

TEST_F(LinuxWorkQueuesTest, AQueueWithoutJobsDoesNotWakeUp) {
  on(standard(), [] { return 0; });
  const auto switches = [](const std::filesystem::path& task) {
    std::ifstream status(task / "status");
    std::string line;
    while (std::getline(status, line)) {
      if (line.starts_with("voluntary_ctxt_switches:")) return std::stol(line.substr(24));
    }
    return -1L;
  };
  const std::string path =
      "/proc/self/task/" + std::to_string(on(standard(), [] { return ::syscall(SYS_gettid); }));
  long before = switches(path);
  // Wait until the thread sleeps again: the count stands still from then on.
  for (int still = 0; still < 20; ++still) {
    std::this_thread::sleep_for(5ms);
    const long now = switches(path);
    if (now != before) still = 0;
    before = now;
  }
  ASSERT_GE(before, 1);
  std::this_thread::sleep_for(50ms);
  EXPECT_EQ(switches(path), before);
}

}  // namespace
}  // namespace zal::testing
