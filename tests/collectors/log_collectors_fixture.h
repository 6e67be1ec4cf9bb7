#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <stdexcept>
#include <string>
#include <vector>

#include "collectors/collectors.h"
#include "tests/support/fake_platform.h"

namespace zal::testing {

/// All collectors over one host whose files are real: every root below one home, `out` the
/// destination. The dump starts at 10:03 o'clock local time of the first day of 2013.
class LogCollectorsFixture : public ::testing::Test {
 protected:
  LogCollectorsFixture() { std::filesystem::create_directories(out); }

  /// Makes a file below the home whose content is its own name.
  void put(const std::string& name) { writeFile(host.home / name, name); }
  void putReport(const std::string& name) { put("Logs/Reports/" + name); }
  [[nodiscard]] std::string gathered() const { return listTree(out); }
  /// Whether the file of the destination is the very file below the home.
  [[nodiscard]] bool isLinked(const std::string& name, const std::string& source) const {
    std::error_code error;
    return std::filesystem::equivalent(out + "/" + name, host.home / source, error);
  }
  [[nodiscard]] WallTime at(int hour, int minute, int second = 0) const {
    return *host.host.momentOf(
        {.year = 2013, .month = 1, .day = 1, .hour = hour, .minute = minute, .second = second});
  }
  /// Placing any file whose path contains the text throws, as nothing of ours does.
  void throwAt(const std::string& text) {
    host.files.failWith = [text](const std::string& source) {
      if (source.find(text) != std::string::npos) throw std::runtime_error("the roof is on fire");
      return std::error_code{};
    };
  }

  FakePlatform host;
  const std::string out = host.home / "out";
  const WallTime start = at(10, 3);
  Collectors collectors{host.platform};
  LogCollectors& logs = collectors.logs;
  std::vector<std::string>& lines = host.agentLog.lines;
};

}  // namespace zal::testing
