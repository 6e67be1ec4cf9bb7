#pragma once

#include <string>
#include <string_view>

namespace zal {

class AgentLog;
class FilePlacement;
class GatheringWitnesses;
class SystemShell;

/// Runs the command lines of the collectors, each with its output and errors in one file of a
/// directory. The command line goes to the shell as it is, pipes and all; what a command does or
/// says is seen in its output file alone. The names of the outputs are known beforehand and may lie in
/// directories that everybody writes to: a file or link that somebody laid there is neither followed nor
/// overwritten. When it cannot be removed, the command is left out and the log says so. Any thread; keeps
/// no state.
class CommandRunner {
 public:
  /// All are borrowed; without witnesses nobody hears of it.
  CommandRunner(SystemShell& shell, FilePlacement& files, AgentLog& log,
                const GatheringWitnesses* witnesses = nullptr)
      : _shell(shell), _files(files), _log(log), _witnesses(witnesses) {}

  /// Returns at once; the command goes on by itself, even when this process ends. The directory
  /// must exist; the file is created or truncated.
  void RunCommandInBackground(std::string_view commandLine, std::string_view directory,
                              std::string_view fileName);
  /// The same, but returns when the command has finished. Returned: false when it was left out.
  bool RunCommandAndWait(std::string_view commandLine, std::string_view directory, std::string_view fileName);

 private:
  [[nodiscard]] bool _isOursToWrite(std::string_view directory, std::string_view fileName);

  SystemShell& _shell;
  FilePlacement& _files;
  AgentLog& _log;
  const GatheringWitnesses* const _witnesses;
};

}  // namespace zal
