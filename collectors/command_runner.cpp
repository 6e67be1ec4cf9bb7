#include "collectors/command_runner.h"

#include "collectors/gathering_witness.h"
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

void CommandRunner::RunCommandInBackground(std::string_view commandLine, std::string_view directory,
                                           std::string_view fileName) {
  if (_witnesses != nullptr) _witnesses->command(commandLine, directory, fileName, std::nullopt);
  _shell.PerformSystemInBackground(redirected(commandLine, directory, fileName) + " &");
}

void CommandRunner::RunCommandAndWait(std::string_view commandLine, std::string_view directory,
                                      std::string_view fileName) {
  const int status = _shell.PerformSystem(redirected(commandLine, directory, fileName));
  if (_witnesses != nullptr) _witnesses->command(commandLine, directory, fileName, status);
}

}  // namespace zal
