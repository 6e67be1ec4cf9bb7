#include "platform/linux/wifi/linux_wifi_diagnostics.h"

#include <poll.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <system_error>
#include <utility>

#include "platform/linux/files/escaped_text.h"
#include "platform/linux/process/all_signals_blocked.h"
#include "platform/linux/process/child_environment.h"
#include "platform/linux/process/child_setup.h"
#include "platform/linux/process/process_descriptor.h"

namespace zal {
namespace {

/// For the program to end its tools and write its note after being told to end.
constexpr std::chrono::milliseconds kGrace{500};

using Moment = std::chrono::steady_clock::time_point;

bool endsBefore(const Descriptor& process, Moment end) {
  pollfd watched{.fd = process.get(), .events = POLLIN, .revents = 0};
  for (;;) {
    const auto left =
        std::chrono::ceil<std::chrono::milliseconds>(end - std::chrono::steady_clock::now()).count();
    const int ready = ::poll(&watched, 1, static_cast<int>(std::max<std::int64_t>(left, 0)));
    if (ready != 0 && !(ready < 0 && errno == EINTR)) return ready > 0;
    if (ready == 0 && std::chrono::steady_clock::now() >= end) return false;
  }
}

int resultOf(int status) { return WIFEXITED(status) ? WEXITSTATUS(status) : LinuxWifiDiagnostics::kBroken; }

}  // namespace

LinuxWifiDiagnostics::LinuxWifiDiagnostics(AgentLog& log, std::string helper, std::chrono::milliseconds limit)
    : _log(log), _helper(std::move(helper)), _limit(limit) {}

LinuxWifiDiagnostics::~LinuxWifiDiagnostics() {
  {
    const std::scoped_lock lock(_lock);
    if (_child > 0) ::kill(_child, SIGTERM);
  }
  if (_thread.joinable()) _thread.join();
}

void LinuxWifiDiagnostics::takeDump(const std::string& directory, const std::string& reason,
                                    Completion completion) {
  {
    const std::scoped_lock lock(_lock);
    if (_isTaken || _startOne(directory, reason)) {
      _waiting.push_back(std::move(completion));
      return;
    }
  }
  completion(kNotAvailable);
}

bool LinuxWifiDiagnostics::_startOne(const std::string& directory, const std::string& reason) {
  if (_thread.joinable()) _thread.join();  // it has said its last word
  const std::string text(cutAtCharacter(reason, kLongestReason));
  ChildSetup setup;
  const int error = setup.start(_child, _helper, {_helper, "--directory", directory, "--reason", text},
                                ChildEnvironment().pointers());
  if (error != 0) {
    _child = -1;
    _log.warning("Wi-Fi diagnostics: cannot start " + _helper + ": " +
                 std::generic_category().message(error));
    return false;
  }
  try {
    const AllSignalsBlocked inTheNewThread;
    _thread = std::thread([this, child = _child] { _awaitEnd(child); });
  } catch (const std::system_error& trouble) {
    ::kill(_child, SIGKILL);
    ::waitpid(std::exchange(_child, -1), nullptr, 0);
    _log.warning(std::string("Wi-Fi diagnostics: no thread to wait for them: ") + trouble.what());
    return false;
  }
  return _isTaken = true;
}

void LinuxWifiDiagnostics::_awaitEnd(pid_t child) {
  const Descriptor process = processDescriptor(child);
  const Moment end = std::chrono::steady_clock::now() + _limit;
  bool isCutOff = false;
  // Without a descriptor (an old kernel) the program's own limit has to do.
  if (process.isOpen() && !endsBefore(process, end)) {
    isCutOff = true;
    ::kill(child, SIGTERM);
    if (!endsBefore(process, end + kGrace)) ::kill(child, SIGKILL);
  }
  siginfo_t ended{};
  while (::waitid(P_PID, static_cast<id_t>(child), &ended, WEXITED | WNOWAIT) != 0 && errno == EINTR) {
  }
  int status = 0;
  {
    // Its number is another's from the next line on.
    const std::scoped_lock lock(_lock);
    _child = -1;
    ::waitpid(child, &status, 0);
  }
  _complete(isCutOff ? kCutOff : resultOf(status));
}

void LinuxWifiDiagnostics::_complete(int result) {
  for (;;) {
    std::vector<Completion> waiting;
    {
      const std::scoped_lock lock(_lock);
      waiting.swap(_waiting);
      _isTaken = !waiting.empty();
      if (!_isTaken) return;
    }
    for (const Completion& completion : waiting) completion(result);
  }
}

}  // namespace zal
