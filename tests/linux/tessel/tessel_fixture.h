#pragma once

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "tests/support/child_program.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// Runs the real program in UTC.
class TesselFixture : public ::testing::Test {
 protected:
  int run(std::vector<std::string> arguments) {
    std::filesystem::remove(directory / "out");
    std::filesystem::remove(directory / "err");
    ChildProgram child(options(std::move(arguments)));
    const auto status = child.waitForExit();
    out = readFile(directory / "out");
    err = readFile(directory / "err");
    return status.value_or(-1000);
  }
  /// Starts it with -w and appends lines by `writeProbe` until it shows one of them: from then on it
  /// sees whatever comes.
  void follow(std::vector<std::string> arguments, const std::function<void(const std::string&)>& writeProbe) {
    arguments.insert(arguments.begin(), "-w");
    program = std::make_unique<ChildProgram>(options(std::move(arguments)));
    int probes = 0;
    ASSERT_TRUE(eventually([&] {
      writeProbe("probe " + std::to_string(++probes));
      return printed().find("probe") != std::string::npos;
    })) << readFile(directory / "err");
    const std::string last = "probe " + std::to_string(probes) + "\n";
    ASSERT_TRUE(eventually([&] { return printed().ends_with(last); })) << printed();
    _seen = printed().size();
  }
  /// All that -w printed; what came behind the probes.
  [[nodiscard]] std::string printed() const { return readFile(directory / "out"); }
  [[nodiscard]] std::string news() const { return printed().substr(_seen); }
  [[nodiscard]] bool newsBecome(const std::string& text) const {
    return eventually([&] { return news() == text; });
  }
  static void append(const std::string& path, const std::string& text) {
    const int file = ::open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT, 0644);
    EXPECT_EQ(::write(file, text.data(), text.size()), static_cast<ssize_t>(text.size()));
    ::close(file);
  }

  TemporaryDirectory directory;
  std::unique_ptr<ChildProgram> program;
  std::string out;
  std::string err;

 private:
  [[nodiscard]] ChildProgram::Options options(std::vector<std::string> arguments) const {
    arguments.insert(arguments.begin(), ZAL_TESSEL_PATH);
    return {.command = std::move(arguments),
            .output = directory / "out",
            .errors = directory / "err",
            .environment = {{"TZ", "UTC0"}}};
  }
  std::size_t _seen = 0;
};

}  // namespace zal::testing
