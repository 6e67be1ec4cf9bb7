#include "tests/crash_points/trial.h"

#include <sys/epoll.h>
#include <sys/syscall.h>
#include <sys/uio.h>

#include <csignal>
#include <cstring>

#include <chrono>
#include <condition_variable>
#include <exception>
#include <filesystem>
#include <mutex>
#include <string_view>
#include <thread>

#include "tests/crash_points/aftermath.h"
#include "tests/crash_points/supervised_agent.h"
#include "tests/e2e/agent_process.h"
#include "tests/support/child_program.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

/// A run takes a tenth of a second; who needs that long waits for something that does not come.
constexpr std::chrono::seconds kLongestRun{10};

/// Ends an agent that hangs, so that its client sees the end of the stream.
class Watchdog {
 public:
  explicit Watchdog(const SupervisedAgent& agent) : _thread([this, &agent] { _watch(agent); }) {}
  ~Watchdog() {
    {
      const std::scoped_lock lock(_mutex);
      _isOver = true;
    }
    _change.notify_all();
    _thread.join();
  }
  Watchdog(const Watchdog&) = delete;
  Watchdog& operator=(const Watchdog&) = delete;
  [[nodiscard]] bool hasBitten() const {
    const std::scoped_lock lock(_mutex);
    return _hasBitten;
  }

 private:
  void _watch(const SupervisedAgent& agent) {
    std::unique_lock lock(_mutex);
    if (_change.wait_for(lock, kLongestRun, [this] { return _isOver; })) return;
    _hasBitten = true;
    agent.signal(SIGKILL);
  }
  mutable std::mutex _mutex;
  std::condition_variable _change;
  bool _isOver = false, _hasBitten = false;
  std::thread _thread;  // last: uses all others
};

/// What the process has there has a name on a disk.
bool isFile(pid_t process, int descriptor) {
  const std::string place = "/proc/" + std::to_string(process) + "/fd/" + std::to_string(descriptor);
  std::error_code error;
  return std::filesystem::read_symlink(place, error).string().starts_with('/');
}

/// A short text in the memory of the process.
std::string textOf(pid_t process, std::uint64_t address) {
  std::string text;
  char character = 1;
  iovec here{&character, 1};
  for (; text.size() < 4096; text += character) {
    iovec there{reinterpret_cast<void*>(address + text.size()), 1};
    if (::process_vm_readv(process, &here, 1, &there, 1, 0) != 1 || character == 0) break;
  }
  return text;
}

class Trial {
 public:
  Trial(const Scenario& scenario, const TrialPoint& point) : _scenario(scenario), _point(point) {}

  TrialResult run(const std::string& keepIn) {
    try {
      _scenario.prepare(_sandbox);
      _sandbox.writeConfiguration();
      _harm();
      _recover();
      _look();
    } catch (const std::exception& exception) {
      _result.violations.emplace_back(exception.what());
    }
    _result.confirmed = _told.confirmed();
    if (!keepIn.empty()) {
      std::filesystem::copy(
          _sandbox / "", keepIn,
          std::filesystem::copy_options::recursive | std::filesystem::copy_options::copy_symlinks);
    }
    return _result;
  }

 private:
  /// On the supervisor's thread.
  Judgement _judge(pid_t process, const WatchedCall& call, const seccomp_data& data) {
    using Kind = Judgement::Kind;
    if (_point.harm == Harm::tear) {
      if (!call.writes || data.args[2] < 2) return {};
    } else if (_point.harm == Harm::fault && call.ofFilesOnly &&
               !isFile(process, static_cast<int>(data.args[0]))) {
      return {};
    }
    if (_point.harm == Harm::fault && !_isConfigured(process, call, data)) return {};
    // Only what is added can be too much.
    if (_point.harm == Harm::fault && call.number == SYS_epoll_ctl && data.args[1] != EPOLL_CTL_ADD)
      return {};
    if (++_counted != _point.number) return {};
    _result.isReached = true;
    _result.call = call.name;
    _result.errors = call.errors.size();
    if (_point.harm == Harm::tear) return {.kind = Kind::tearsAndKills, .bytes = data.args[2] / 2};
    if (_point.harm == Harm::kill) return {.kind = Kind::kills};
    if (_point.error >= call.errors.size()) return {};
    _result.call += std::string(" ") + ::strerrorname_np(call.errors[_point.error]);
    return {.kind = Kind::fails, .error = call.errors[_point.error]};
  }

  /// Faults begin when the configuration has been read: without it the agent would work elsewhere.
  bool _isConfigured(pid_t process, const WatchedCall& call, const seccomp_data& data) {
    if (_seenConfiguration && std::string_view(call.name) == "openat") _hasConfiguration = true;
    if (!_hasConfiguration && std::string_view(call.name) == "openat")
      _seenConfiguration |= textOf(process, data.args[1]).ends_with("/lirra.toml");
    return _hasConfiguration;
  }

  void _harm() {
    SupervisedAgent agent(_sandbox, _point.harm == Harm::fault ? callsThatMayFail() : callsThatChange(),
                          [this](pid_t process, const WatchedCall& call, const seccomp_data& data) {
                            return _judge(process, call, data);
                          });
    const Watchdog watchdog(agent);
    PlayedClient client(_sandbox.socketPath(), [&] { return agent.hasEnded(); });
    _scenario.play(_sandbox, client, _told);
    agent.signal(SIGTERM);
    const auto status = agent.waitForExit(std::chrono::minutes(1));
    if (watchdog.hasBitten()) return _result.violations.emplace_back("hung"), void();
    _judgeEnd(status.value_or(-SIGKILL));
  }

  void _judgeEnd(int status) {
    _result.outcome = "status " + std::to_string(status);
    const bool isKilled = _result.isReached && _point.harm != Harm::fault;
    if (isKilled ? status != -SIGKILL : status < 0) {
      _result.violations.push_back("ended with " + std::to_string(status));
    } else if (!isKilled && status != 0) {
      _result.outcome += ": it says so";
      if (readFile(_sandbox.outputFile()).empty()) _result.violations.emplace_back("ended without a word");
    }
  }

  /// The agent that the service manager would start next, until nothing is left to do for it.
  void _recover() {
    AgentProcess agent(_sandbox);
    eventually(
        [this] {
          Aftermath now(_sandbox);
          now.checkStrays();
          now.checkArchives();
          return now.violations().empty();
        },
        std::chrono::seconds(5));
    const auto status = agent.terminate();
    if (status != 0)
      _result.violations.push_back("the next agent ended with " + std::to_string(status.value_or(-1)));
  }

  void _look() {
    Aftermath after(_sandbox);
    _scenario.check(after, _told);
    after.checkArchives();
    after.checkStrays();
    for (const std::string& violation : after.violations()) _result.violations.push_back(violation);
  }

  const Scenario& _scenario;
  const TrialPoint _point;
  AgentSandbox _sandbox;
  Told _told;
  TrialResult _result;
  bool _seenConfiguration = false, _hasConfiguration = false;
  std::uint64_t _counted = 0;  // on the supervisor's thread
};

}  // namespace

TrialResult tryPoint(const Scenario& scenario, const TrialPoint& point, const std::string& keepIn) {
  return Trial(scenario, point).run(keepIn);
}

}  // namespace zal::testing
