#include "platform/main_thread_watch.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/support/manual_run_loop.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using Lines = std::vector<std::string>;
using Span = MainThreadWatch::Span;

class MainThreadWatchTest : public ::testing::Test {
 protected:
  testing::ManualRunLoop host;
  Lines told;
  MainThreadWatch watch{
      host, 50ms, [this](std::string_view kind, std::string_view name, std::chrono::milliseconds held) {
        told.push_back(std::string(kind) + " " + std::string(name) + " " + std::to_string(held.count()));
      }};

  void hold(std::chrono::nanoseconds time) { host.advance(time); }
};

TEST_F(MainThreadWatchTest, TellsOfWhatTakesLongerThanTheLimit) {
  for (const auto time : {49ms, 50ms, 51ms}) {
    const Span span("request", "checkpoint");
    hold(time);
  }
  EXPECT_EQ(told, (Lines{"request checkpoint 51"}));
}

TEST_F(MainThreadWatchTest, TellsOfTheInnerOneAloneWhenThatTookTheTime) {
  {
    const Span turn("input");
    hold(30ms);
    {
      const Span request("request", "action");
      hold(70ms);
    }
    hold(20ms);
  }
  EXPECT_EQ(told, (Lines{"request action 70"}));
}

TEST_F(MainThreadWatchTest, TellsOfTheOuterOneForManySmallThings) {
  {
    const Span turn("input");
    for (int request = 0; request < 6; ++request) {
      const Span inner("request", "checkpoint");
      hold(10ms);
    }
  }
  EXPECT_EQ(told, (Lines{"input  60"}));
}

TEST_F(MainThreadWatchTest, TellsOfBothWhenBothTookLong) {
  {
    const Span turn("input");
    {
      const Span request("request", "action");
      hold(60ms);
    }
    hold(80ms);
  }
  EXPECT_EQ(told, (Lines{"request action 60", "input  80"}));
}

TEST_F(MainThreadWatchTest, SaysNothingOfAWaitThatIsMeantToBe) {
  {
    const Span request("request", "action");
    {
      const MainThreadWatch::WantedWait wait;
      hold(15s);
    }
    hold(50ms);
  }
  EXPECT_EQ(told, Lines());
}

TEST(MainThreadUnwatchedTest, SpansDoNothingWithoutAWatch) {
  testing::ManualRunLoop host;
  int told = 0;
  {
    const MainThreadWatch watch(host, 50ms, [&](auto, auto, auto) { ++told; });
  }
  {
    const Span span("request", "action");
    host.advance(1h);
  }
  EXPECT_EQ(told, 0);
}

}  // namespace
}  // namespace zal
