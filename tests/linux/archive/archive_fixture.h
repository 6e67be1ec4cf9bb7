#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "platform/linux/archive/zip_file_copier.h"
#include "tests/linux/archive/archive_readers.h"
#include "tests/support/fake_services.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/manual_work_queues.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// Real files, and queues that run when the test says so: a job writes in its first step and reads back
/// in its second.
class ArchiveFixture : public ::testing::TestWithParam<ArchiveCompression> {
 protected:
  static constexpr const char* kQueue = "global.default";

  [[nodiscard]] std::string input(const std::string& name = "") const {
    return _files / ("Dump" + (name.empty() ? "" : "/" + name));
  }
  [[nodiscard]] std::string output() const { return _files / "out/archive.zip"; }

  void SetUp() override {
    std::filesystem::create_directories(input());
    std::filesystem::create_directories(_files / "out");
  }
  std::shared_ptr<FileCopierJob> makeJob(const std::string& from, const std::string& to) {
    return copier.makeJob(from, to, "the identifier of " + from, CopierOperation::compressIntoZip,
                          queues.main(),
                          [this](FileCopierJob& job) { completed.push_back(job.identifier()); });
  }
  /// From start to completion.
  void archive() {
    const auto job = makeJob(input(), output());
    job->start();
    queues.runAll();
  }
  [[nodiscard]] std::string files() const { return _files.path(); }

  ManualRunLoop loop;
  ManualWorkQueues queues{loop};
  RecordingAgentLog log;
  ZipFileCopier copier{queues, log, GetParam()};
  std::vector<std::string> completed;

 private:
  const TemporaryDirectory _files;
};

inline std::string compressionName(const ::testing::TestParamInfo<ArchiveCompression>& info) {
  return info.param == ArchiveCompression::small ? "Small" : "Fast";
}

}  // namespace zal::testing
