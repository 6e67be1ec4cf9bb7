#include "platform/main_thread_check.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

struct Owned {
  MainThreadCheck mainThread;
  void touch() const { mainThread.check("Owned"); }
};

TEST(MainThreadCheckTest, TheOwningThreadPasses) { Owned{}.touch(); }

#ifndef NDEBUG
TEST(MainThreadCheckDeathTest, AnotherThreadIsNamedAndEndsTheProcess) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_DEATH(
      {
        Owned owned;
        std::jthread([&] { owned.touch(); }).join();
      },
      "Owned belongs to thread .* but touch was called on thread");
}
#endif

}  // namespace
}  // namespace zal
