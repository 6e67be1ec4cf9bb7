#include "platform/linux/host/held_text.h"

#include <gtest/gtest.h>

#include <functional>

namespace zal {

struct Example {
  static std::function<void()> task() {
    return [] {};
  }
};

namespace {

TEST(HeldTextTest, NamesWhatItWas) {
  EXPECT_EQ(heldText("request", "begin session", std::chrono::milliseconds(73)),
            "The main thread was held for 73 ms: request begin session");
  EXPECT_EQ(heldText("barrier", "", std::chrono::milliseconds(51)),
            "The main thread was held for 51 ms: barrier");
}

TEST(HeldTextTest, ATypeIsShownAsTheSourceHasIt) {
  const std::string text =
      heldText("timer", Example::task().target_type().name(), std::chrono::milliseconds(60));
  EXPECT_EQ(text.find("The main thread was held for 60 ms: timer Example::task()::"), 0U) << text;
}

}  // namespace
}  // namespace zal
