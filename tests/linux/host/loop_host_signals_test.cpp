#include "platform/linux/host/loop_host_signals.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <csignal>
#include <string>
#include <vector>

namespace zal {
namespace {

using ::testing::ElementsAre;

class LoopHostSignalsTest : public ::testing::Test {
 protected:
  /// Raises the signal and runs the loop until its handler stops it.
  void receive(int signal) {
    std::raise(signal);
    loop.run();
  }
  std::vector<std::string> calls;
  LinuxRunLoop loop;
  LoopHostSignals signals{loop, [this] { calls.emplace_back("announced"); }};
};

TEST_F(LoopHostSignalsTest, ATerminationIsAnnouncedBeforeItsHandlerRuns) {
  signals.onTerminate([this] {
    calls.emplace_back("terminate");
    loop.stop();
  });
  receive(SIGTERM);
  EXPECT_THAT(calls, ElementsAre("announced", "terminate"));
}

TEST_F(LoopHostSignalsTest, AReloadIsHandledEachTime) {
  signals.onReload([this] {
    calls.emplace_back("reload");
    loop.stop();
  });
  receive(SIGHUP);
  receive(SIGHUP);
  EXPECT_THAT(calls, ElementsAre("reload", "reload"));
}

TEST_F(LoopHostSignalsTest, SignalsWithoutAHandlerAreTakenAndForgotten) {
  std::raise(SIGHUP);
  signals.onTerminate([this] { loop.stop(); });
  receive(SIGTERM);
  EXPECT_THAT(calls, ElementsAre("announced"));
}

}  // namespace
}  // namespace zal
