#pragma once

#include <string>
#include <utility>
#include <vector>

#include "platform/ping_test.h"

namespace zal::testing {

/// A ping facility whose tests finish when the test says so.
class ScriptedPings : public PingFacility {
 public:
  class Test : public PingTest {
   public:
    std::string address;
    bool wifi = false;
    double longInterval = 60.0;
    double seconds = 0;
    bool started = false, stopped = false, writeFails = false;
    std::string queueLabel;
    std::vector<std::string> written;
    CompletionHandler handler;
    WorkQueue* queue = nullptr;

    [[nodiscard]] double longTimeInterval() const override { return longInterval; }
    void startWithTimeout(double timeout, WorkQueue& on, CompletionHandler done) override {
      seconds = timeout;
      started = true;
      queue = &on;
      queueLabel = on.label();
      handler = std::move(done);
    }
    bool writeResultsToFile(const std::string& path, std::string& error) override {
      if (writeFails) {
        error = "disk is full";
        return false;
      }
      written.push_back(path);
      return true;
    }
    [[nodiscard]] double secondsToRun() const override { return seconds; }
    void stop() override { stopped = true; }
    /// Delivers the completion on the queue that was given at the start.
    void finish(std::string result, bool success) {
      queue->async(
          [handler = std::move(handler), result = std::move(result), success] { handler(result, success); });
    }
  };

  /// Tests that never finished are let go: their handlers hold them.
  ~ScriptedPings() override;

  std::vector<std::shared_ptr<Test>> tests;
  [[nodiscard]] std::shared_ptr<PingTest> makeTest(std::string address, bool useWifi) override {
    auto test = std::make_shared<Test>();
    test->address = std::move(address);
    test->wifi = useWifi;
    tests.push_back(test);
    return test;
  }
};

}  // namespace zal::testing
