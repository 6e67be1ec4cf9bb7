#include "tests/support/wait_watch.h"

#include <gtest/gtest.h>
#include <poll.h>
#include <sys/epoll.h>
#include <unistd.h>

#include <atomic>
#include <thread>

#include "platform/linux/files/descriptor.h"

namespace zal::testing {
namespace {

/// A thread that begins the wait again and again, as a loop would.
template <class Wait>
unsigned strayWaitsIn(Wait wait) {
  std::atomic<pid_t> number = 0;
  std::atomic<bool> stop = false;
  std::thread waiting([&] {
    number = ::gettid();
    while (!stop) wait();
  });
  while (number == 0) std::this_thread::yield();
  unsigned seen = 0;
  {
    const WaitWatch watch(::getpid(), number);
    // Running between two waits is no wait: enough looks for one of them to meet it.
    for (int look = 0; look < 50; ++look) watch.awaitLook();
    seen = watch.strayWaits();
  }
  stop = true;
  waiting.join();
  return seen;
}

TEST(WaitWatchTest, SeesAThreadThatWaitsInPollAndNoneThatWaitsInEpoll) {
  if (const std::string obstacle = WaitWatch::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
  constexpr int kMilliseconds = 20;
  EXPECT_GT(strayWaitsIn([] { ::poll(nullptr, 0, kMilliseconds); }), 0U);
  const Descriptor nothing(::epoll_create1(EPOLL_CLOEXEC));
  EXPECT_EQ(strayWaitsIn([&] {
              epoll_event event{};
              ::epoll_wait(nothing.get(), &event, 1, kMilliseconds);
            }),
            0U);
}

}  // namespace
}  // namespace zal::testing
