#pragma once

#include <sys/types.h>

#include <functional>
#include <string>

namespace zal::testing {

/// A process of the test's own. Killed at the end.
class TargetProcess {
 public:
  /// Runs the target program with that word (target/main.cpp).
  explicit TargetProcess(const std::string& word, int output = -1);
  /// The body runs in a child of this process, which ends when it returns.
  explicit TargetProcess(const std::function<void()>& body);
  ~TargetProcess();
  TargetProcess(const TargetProcess&) = delete;
  TargetProcess& operator=(const TargetProcess&) = delete;

  [[nodiscard]] pid_t id() const { return _id; }
  void signal(int number) const;
  /// Whether its threads come to have these states, within some seconds: "SS".
  [[nodiscard]] bool becomes(const std::string& states) const;
  /// The kernel's letters for all its threads; none before the program runs.
  [[nodiscard]] std::string states() const;
  /// Nobody traces any thread of it.
  [[nodiscard]] bool isFree() const;
  /// Waits for its end. Returned: the wait status.
  int end();

 private:
  pid_t _id = -1;
  std::string _name;  ///< as the kernel knows it when it runs; empty: any
};

}  // namespace zal::testing
