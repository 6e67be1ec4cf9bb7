#pragma once

#include <gtest/gtest.h>

#include <chrono>
#include <string>
#include <vector>

#include "collectors/collectors.h"
#include "dump/closing_stages.h"
#include "dump/log_compressor.h"
#include "tests/support/fake_platform.h"

namespace zal::testing {

using namespace std::chrono_literals;

/// Closing stages over a whole fake host, with the command lines as they stand.
class CollectionFixture : public ::testing::Test {
 protected:
  CollectionFixture() { host.configuration.commands.profile = CommandProfile::literal; }

  /// Lets time pass and runs all that became due, on every queue.
  void advance(std::chrono::nanoseconds duration) {
    host.host.advance(duration);
    host.queues.runAll();
  }
  [[nodiscard]] bool exists(const std::string& path) const {
    return std::filesystem::exists(std::filesystem::symlink_status(host.home / path));
  }
  void put(const std::string& path) { writeFile(host.home / path, "content of " + path + "\n"); }
  [[nodiscard]] std::vector<std::string> linesWith(const std::string& fragment) const {
    std::vector<std::string> found;
    for (const std::string& line : host.agentLog.lines) {
      if (line.find(fragment) != std::string::npos) found.push_back(line);
    }
    return found;
  }

  FakePlatform host;
  Collectors collectors{host.platform};
  _LirraLogCompressor compressor{
      {.log = host.agentLog, .copier = host.fileCopier, .files = host.files, .queues = host.queues}};
  ClosingStages closing{{.platform = host.platform, .collectors = collectors, .compressor = compressor}};
};

}  // namespace zal::testing
