#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "collectors/file_collector.h"
#include "tests/support/fake_services.h"
#include "tests/support/plain_file_placement.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// A collector over real files: `in` is the home and source side, `out` the destination side.
class CollectorFixture : public ::testing::Test {
 protected:
  CollectorFixture() {
    std::filesystem::create_directories(in);
    std::filesystem::create_directories(out);
    roots.UserLogRoot = "~/Logs";
    roots.DiagnosticReportRoot = in + "/Reports";
    roots.TemporaryRoot = shared;
  }

  void put(const std::string& name) { writeFile(in + "/" + name, "content of " + name + "\n"); }
  static bool sameFile(const std::string& a, const std::string& b) {
    std::error_code error;
    return std::filesystem::equivalent(a, b, error);
  }

  TemporaryDirectory directory;
  const std::string in = std::filesystem::canonical(directory.path()).string() + "/in";
  const std::string out = std::filesystem::canonical(directory.path()).string() + "/out";
  const std::string shared = std::filesystem::canonical(directory.path()).string() + "/shared";
  DirectoryRoots roots;
  PlainFilePlacement files{in};
  RecordingAgentLog log;
  FileCollector collector{files, log, roots};
};

}  // namespace zal::testing
