#include "platform/linux/crash/linux_crash_reporter.h"

#include <unistd.h>

#include <system_error>
#include <utility>

#include "platform/linux/crash/helper_run.h"
#include "platform/linux/files/escaped_text.h"

namespace zal {
namespace {

/// The kernel takes arguments up to a limit, and a report's reader has one too.
constexpr std::size_t kMostText = 8192;

/// As an argument, which a byte of zero would end.
std::string argumentText(std::string_view text) {
  return std::string(cutAtCharacter(text.substr(0, text.find('\0')), kMostText));
}

}  // namespace

LinuxCrashReporter::LinuxCrashReporter(asio::io_context& loop, AgentLog& log, Places places)
    : _loop(loop), _log(log), _places(std::move(places)) {}

bool LinuxCrashReporter::simulateCrash(pid_t process, std::uint32_t exceptionCode, std::string_view message) {
  const std::string what = "report of process " + std::to_string(process);
  if (process <= 0) {
    _log.warning("Crash service: no " + what + ": there is no such process");
    return false;
  }
  return _start(what, {"--pid", std::to_string(process), "--code", std::to_string(exceptionCode), "--message",
                       argumentText(message)});
}

bool LinuxCrashReporter::simulateCrashForException(std::string_view description) {
  return _start("report of an exception",
                {"--pid", std::to_string(::getpid()), "--exception", argumentText(description)},
                kExceptionPatience);
}

bool LinuxCrashReporter::stackshot(std::string_view reason, std::uint32_t code) {
  return _start("stackshot", {"--code", std::to_string(code), "--reason", argumentText(reason)});
}

bool LinuxCrashReporter::_start(const std::string& what, std::vector<std::string> arguments,
                                std::chrono::milliseconds patience) {
  const auto run = std::make_shared<HelperRun>(_log, what, _running);
  if (*_running > kMostAtOnce) {
    _log.warning("Crash service: no " + what + ": " + std::to_string(kMostAtOnce) + " are being made");
    return false;
  }
  arguments.insert(arguments.begin(), _places.helper);
  arguments.insert(arguments.end(), {"--output", _places.reportDirectory + "/"});
  if (const int error = run->start(arguments)) {
    _log.warning("Crash service: no " + what + ": " + _places.helper + ": " +
                 std::generic_category().message(error));
    return false;
  }
  if (patience.count() == 0 || !run->waitForEnd(patience)) run->leaveTo(_loop);
  return true;
}

}  // namespace zal
