#pragma once

#include <string>
#include <string_view>

namespace zal {

class GatheringWitnesses;
class SystemShell;

/// Runs the command lines of the collectors, each with its output and errors in one file of a
/// directory. The command line goes to the shell as it is, pipes and all; what a command does or
/// says is seen in its output file alone. Any thread; keeps no state.
class CommandRunner {
 public:
  /// Both are borrowed; without witnesses nobody hears of it.
  explicit CommandRunner(SystemShell& shell, const GatheringWitnesses* witnesses = nullptr)
      : _shell(shell), _witnesses(witnesses) {}

  /// Returns at once; the command goes on by itself, even when this process ends. The directory
  /// must exist; the file is created or truncated.
  void RunCommandInBackground(std::string_view commandLine, std::string_view directory,
                              std::string_view fileName);
  /// The same, but returns when the command has finished.
  void RunCommandAndWait(std::string_view commandLine, std::string_view directory, std::string_view fileName);

 private:
  SystemShell& _shell;
  const GatheringWitnesses* const _witnesses;
};

}  // namespace zal
