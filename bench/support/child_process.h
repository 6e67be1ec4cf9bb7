#pragma once

#include <sys/types.h>

#include <filesystem>
#include <functional>
#include <string>
#include <vector>

namespace zal::bench {

/// One program under measurement. Killed and waited for when it goes out of scope.
class ChildProcess {
 public:
  struct Options {
    std::vector<std::string> command;
    std::vector<std::string> environment;        ///< added to ours, "NAME=value"
    std::filesystem::path output = "/dev/null";  ///< standard output and error
    std::function<const char*()> beforeExec;     ///< in the child; returns what failed, or null
  };

  ChildProcess() = default;
  /// A program that cannot be started ends at once with status 127 and its reason in `output`.
  explicit ChildProcess(const Options& options);
  ~ChildProcess();
  ChildProcess(ChildProcess&& other) noexcept;
  ChildProcess& operator=(ChildProcess&& other) noexcept;

  [[nodiscard]] pid_t id() const { return _id; }
  [[nodiscard]] bool running();
  /// SIGTERM, then SIGKILL after three seconds.
  void stop();
  /// SIGKILL.
  void kill();

 private:
  pid_t _id = -1;
};

/// Searches the usual directories and the superuser's; empty when the program is not installed.
[[nodiscard]] std::string findProgram(const std::string& name);

/// For `beforeExec`: a mount namespace of the child's own with an empty /run in memory, and a network
/// namespace whose datagram queues are as long as the service manager makes them on a booted host.
/// Needs the superuser or user namespaces. Returns what failed, or null.
const char* enterPrivateHost();

}  // namespace zal::bench
