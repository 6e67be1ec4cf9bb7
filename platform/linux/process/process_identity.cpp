#include "platform/linux/process/process_identity.h"

#include <unistd.h>

#include <optional>
#include <sstream>
#include <string>

#include "platform/linux/files/readable_text.h"

namespace zal {
namespace {

/// The start time that the process file system tells; nothing for a process that has ended.
std::optional<std::uint64_t> startTimeOf(pid_t process) {
  const std::string text = readableText("/proc/" + std::to_string(process) + "/stat");
  // The name stands in parentheses and may hold any of them itself.
  const std::size_t nameEnd = text.rfind(')');
  if (nameEnd == std::string::npos) return std::nullopt;
  std::istringstream fields(text.substr(nameEnd + 1));
  char state = 0;
  fields >> state;
  if (state == 'Z' || state == 'X') return std::nullopt;
  constexpr int kFieldsBetween = 18;  // from the parent's id to the one before the start time
  std::string skipped;
  for (int i = 0; i < kFieldsBetween; ++i) fields >> skipped;
  std::uint64_t startTime = 0;
  if (!(fields >> startTime)) return std::nullopt;
  return startTime;
}

}  // namespace

ProcessIdentity ProcessIdentity::ofThisProcess() { return {::getpid(), startTimeOf(::getpid()).value_or(0)}; }

bool ProcessIdentity::isRunning() const { return processId > 0 && startTimeOf(processId) == startTime; }

}  // namespace zal
