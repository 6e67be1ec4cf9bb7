#pragma once

#include <spawn.h>
#include <sys/types.h>

#include <string>
#include <vector>

namespace zal {

/// What every child of ours begins with: nothing to read on standard input, none of our descriptors
/// above 2 (a child that outlives us must not hold our listener or our logs), default signal
/// dispositions and no signal blocked. One thread; once for one child.
class ChildSetup {
 public:
  ChildSetup();
  ~ChildSetup();
  ChildSetup(const ChildSetup&) = delete;
  ChildSetup& operator=(const ChildSetup&) = delete;

  /// Standard output and errors go into that descriptor instead of ours.
  void sendOutputTo(int descriptor);
  /// After sendOutputTo: the errors go there alone.
  void sendErrorsTo(int descriptor);
  /// It leads a process group of its own, so that it can be ended together with its children.
  void putIntoOwnGroup();
  /// Starts the file, looked for in PATH when its name has no slash. Returned: zero, or the errno
  /// that says why there is no child.
  [[nodiscard]] int start(pid_t& child, const std::string& file, std::vector<std::string> arguments,
                          char* const* environment);

 private:
  posix_spawn_file_actions_t _actions{};
  posix_spawnattr_t _attributes{};
};

}  // namespace zal
