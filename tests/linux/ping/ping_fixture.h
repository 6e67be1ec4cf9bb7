#pragma once

#include <gtest/gtest.h>

#include <chrono>
#include <condition_variable>
#include <deque>
#include <memory>
#include <mutex>
#include <regex>
#include <string>
#include <thread>

#include "platform/linux/ping/linux_ping_test.h"
#include "tests/linux/ping/network_namespaces.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

inline constexpr std::chrono::seconds kDeadline{
    30};  // for what takes a second at most; a slow machine is no failure

/// A queue whose jobs the test takes out and runs.
class MailboxQueue : public WorkQueue {
 public:
  [[nodiscard]] const std::string& label() const override { return _label; }
  void async(Job job) override {
    const std::scoped_lock lock(_mutex);
    _jobs.push_back(std::move(job));
    _arrived.notify_all();
  }
  void asyncAfter(std::chrono::nanoseconds /*delay*/, Job job) override { async(std::move(job)); }

  bool runNext(std::chrono::nanoseconds deadline) {
    Job job;
    {
      std::unique_lock lock(_mutex);
      if (!_arrived.wait_for(lock, deadline, [&] { return !_jobs.empty(); })) return false;
      job = std::move(_jobs.front());
      _jobs.pop_front();
    }
    job();
    return true;
  }
  [[nodiscard]] bool isEmpty() {
    const std::scoped_lock lock(_mutex);
    return _jobs.empty();
  }

 private:
  const std::string _label = "mailbox";
  std::mutex _mutex;
  std::condition_variable _arrived;
  std::deque<Job> _jobs;
};

/// Pings by a real facility on a loop that lives in the near namespace; skips where there is none.
class PingFixture : public ::testing::Test {
 protected:
  void SetUp() override {
    network = NetworkNamespaces::make();
    if (!network) GTEST_SKIP() << "ip could not make a pair of network namespaces here";
    loop = std::make_unique<NamespaceLoop>(network->nearName());
  }
  void TearDown() override { loop.reset(); }

  void prepare(const std::string& address, bool useWifi = true) {
    log.enabledCategories.insert("Ping");
    facility = std::make_unique<LinuxPingFacility>(loop->context, Interfaces{"en0", "pdp_ip0"}, log, methods);
    ping = facility->makeTest(address, useWifi);
  }
  void start(double seconds) {
    ping->startWithTimeout(seconds, queue, [this](std::string_view line, bool ok) {
      ++completions;
      result = line;
      success = ok;
    });
  }
  /// Runs a whole test and gives its result text.
  std::string run(const std::string& address, double seconds, bool useWifi = true) {
    prepare(address, useWifi);
    start(seconds);
    finish();
    return text();
  }
  void finish() { ASSERT_TRUE(queue.runNext(kDeadline)) << "no completion; so far: " << text(); }
  std::string text() {
    std::string error;
    const std::string path = directory / "result.txt";
    EXPECT_TRUE(ping->writeResultsToFile(path, error)) << error;
    return readFile(path);
  }
  /// The text with all times as T.
  static std::string timeless(const std::string& text) {
    const std::string times = std::regex_replace(text, std::regex("time=[0-9.]+ ms"), "time=T ms");
    const std::string total = std::regex_replace(times, std::regex("time [0-9]+ms"), "time Tms");
    return std::regex_replace(total, std::regex("= [0-9./]+ ms"), "= T ms");
  }
  template <typename Condition>
  static bool waitUntil(Condition condition) {
    const auto end = std::chrono::steady_clock::now() + kDeadline;
    while (std::chrono::steady_clock::now() < end) {
      if (condition()) return true;
      std::this_thread::sleep_for(std::chrono::milliseconds{1});
    }
    return false;
  }
  bool waitForText(const std::string& part) {
    return waitUntil([&] { return text().find(part) != std::string::npos; });
  }

  std::unique_ptr<NetworkNamespaces> network;
  TemporaryDirectory directory;
  RecordingAgentLog log;
  MailboxQueue queue;
  PingMethods methods;
  std::unique_ptr<LinuxPingFacility> facility;
  std::unique_ptr<NamespaceLoop> loop;
  std::shared_ptr<PingTest> ping;
  int completions = 0;
  std::string result;
  bool success = false;
};

}  // namespace zal::testing
