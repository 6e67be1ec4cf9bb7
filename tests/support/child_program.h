#pragma once

#include <sys/types.h>

#include <chrono>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace zal::testing {

/// Asks again and again, with short waits, until the condition holds. False after the deadline.
bool eventually(const std::function<bool()>& condition,
                std::chrono::milliseconds deadline = std::chrono::minutes(3));

/// A program as a child process, its outputs in files. Killed at the end if it still runs.
class ChildProgram {
 public:
  struct Options {
    std::vector<std::string> command;  ///< the program's path first
    std::string input = "/dev/null";
    std::string output = "/dev/null";
    std::string errors = "/dev/null";
    std::map<std::string, std::string> environment = {};  ///< over ours
  };
  explicit ChildProgram(const Options& options);
  ~ChildProgram();
  ChildProgram(const ChildProgram&) = delete;
  ChildProgram& operator=(const ChildProgram&) = delete;

  [[nodiscard]] pid_t processId() const { return _process; }
  void signal(int number) const;
  /// The exit status, or minus the signal that ended it; nothing when it runs on for ten seconds.
  std::optional<int> waitForExit();
  /// Its one sleeping thread waits in the kernel; what it does before is done.
  [[nodiscard]] bool sleeps() const;

 private:
  pid_t _process = -1;
  std::optional<int> _status;
};

}  // namespace zal::testing
