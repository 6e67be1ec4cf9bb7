#pragma once

#include <sys/types.h>

#include <functional>
#include <string>

namespace zal::testing {

/// A process of the test's own that somebody looks at. Killed at the end.
class TargetProcess {
 public:
  /// The body runs in the child, which ends when it returns.
  explicit TargetProcess(const std::function<void()>& body);
  ~TargetProcess();
  TargetProcess(const TargetProcess&) = delete;
  TargetProcess& operator=(const TargetProcess&) = delete;

  [[nodiscard]] pid_t id() const { return _id; }
  void signal(int number) const;
  /// Whether so many threads come to have the kernel's state letter, within some seconds.
  [[nodiscard]] bool becomes(char state, std::size_t threads = 1) const;
  /// The states of all its threads: "SS".
  [[nodiscard]] std::string states() const;
  /// Nobody traces any thread of it.
  [[nodiscard]] bool isFree() const;
  /// Waits for its end. Returned: the wait status.
  int end();

 private:
  pid_t _id = -1;
};

}  // namespace zal::testing

/// Functions with a name of their own on a stack: sleeps until the process ends.
extern "C" void zalSleepsInTheTest();
/// The same below so many calls of itself.
extern "C" int zalSleepsDeepInTheTest(int depth);
