#include "collectors/command_runner.h"

#include <system_error>

#include "collectors/gathering_witness.h"
#include "platform/agent_log.h"
#include "platform/file_placement.h"
#include "platform/system_shell.h"

namespace zal {
namespace {

// Directories carry client text (a session type), which must stay text between the quotes.
std::string insideQuotes(std::string_view text) {
  std::string escaped;
  escaped.reserve(text.size());
  for (const char c : text) {
    if (c == '"' || c == '\\' || c == '$' || c == '`') escaped += '\\';
    escaped += c;
  }
  return escaped;
}

std::string redirected(std::string_view commandLine, std::string_view directory, std::string_view fileName) {
  return std::string(commandLine) + " > \"" + insideQuotes(directory) + "/" + insideQuotes(fileName) +
         "\"  2>&1";
}

}  // namespace

bool CommandRunner::_isOursToWrite(std::string_view directory, std::string_view fileName) {
  const std::string path = std::string(directory).append("/").append(fileName);
  const std::error_code error = _files.prepareOutput(path);
  if (error) {
    if (_witnesses != nullptr)
      _witnesses->source(path, std::string(directory), SourceOutcome::failed, error.message());
    _log.warning("Somebody else's file is in the way at " + path + " and cannot be removed (" +
                 error.message() + "); the command is left out");
  }
  return !error;
}

void CommandRunner::RunCommandInBackground(std::string_view commandLine, std::string_view directory,
                                           std::string_view fileName) {
  if (!_isOursToWrite(directory, fileName)) return;
  if (_witnesses != nullptr) _witnesses->command(commandLine, directory, fileName, std::nullopt);
  _shell.performSystemInBackground(redirected(commandLine, directory, fileName) + " &");
}

bool CommandRunner::RunCommandAndWait(std::string_view commandLine, std::string_view directory,
                                      std::string_view fileName) {
  if (!_isOursToWrite(directory, fileName)) return false;
  const int status = _shell.PerformSystem(redirected(commandLine, directory, fileName));
  if (_witnesses != nullptr) _witnesses->command(commandLine, directory, fileName, status);
  return true;
}

}  // namespace zal
