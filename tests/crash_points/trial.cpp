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
#include <optional>
#include <stdexcept>
#include <string_view>
#include <thread>

#include "tests/crash_points/aftermath.h"
#include "tests/crash_points/expected_texts.h"
#include "tests/crash_points/supervised_agent.h"
#include "tests/e2e/agent_process.h"
#include "tests/e2e/small_disk.h"
#include "tests/support/child_program.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

/// A run takes a tenth of a second; who needs that long waits for something that does not come.
constexpr std::chrono::seconds kLongestRun{10};

constexpr std::size_t kBlock = 4096;
constexpr std::size_t kRoom = std::size_t{32} << 20U;
/// More than a call and its archive need, with what is reserved for its last minutes.
constexpr std::uint64_t kMostBlocks = 400;

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

std::string nameOf(pid_t process, std::uint64_t descriptor) {
  const std::string place =
      "/proc/" + std::to_string(process) + "/fd/" + std::to_string(static_cast<int>(descriptor));
  std::error_code error;
  return std::filesystem::read_symlink(place, error).string();
}

/// What the process has there has a name on a disk.
bool isFile(pid_t process, std::uint64_t descriptor) {
  const std::string name = nameOf(process, descriptor);
  return name.starts_with('/') && !name.ends_with("/agent.output");
}

/// Whether epoll_ctl is to watch one more: not what the loop itself is made of, without which there is none.
bool addsMore(pid_t process, const seccomp_data& data) {
  const std::string name = nameOf(process, data.args[2]);
  return data.args[1] == EPOLL_CTL_ADD && name != "anon_inode:[eventfd]" && name != "anon_inode:[timerfd]" &&
         !name.starts_with("pipe:");
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
      if (_point.harm == Harm::disk) _useSmallDisk();
      _scenario.prepare(_sandbox);
      _sandbox.writeConfiguration();
      if (_disk) _disk->leaveFree(_point.number * kBlock);
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
    if (_point.harm == Harm::disk) return {};
    if (_point.harm == Harm::full) return _judgeFull(process, call, data);
    if (_point.harm == Harm::tear) {
      if (!call.writes || data.args[2] < 2) return {};
    } else if (_point.harm == Harm::fault && call.ofFilesOnly && !isFile(process, data.args[0])) {
      return {};
    }
    if (_point.harm == Harm::fault && !_isConfigured(process, call, data)) return {};
    if (_point.harm == Harm::fault && call.number == SYS_epoll_ctl && !addsMore(process, data)) return {};
    if (!_point.of.empty() && _point.of != call.name) return {};
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

  Judgement _judgeFull(pid_t process, const WatchedCall& call, const seccomp_data& data) {
    using Kind = Judgement::Kind;
    if (!call.writes || !isFile(process, data.args[0])) return {};
    if (++_counted < _point.number) return {};
    _result.isReached = true;
    if (_counted > _point.number || data.args[2] < 2) return {.kind = Kind::fails, .error = ENOSPC};
    _result.call = call.name;
    return {.kind = Kind::shortens, .bytes = data.args[2] / 2};
  }

  /// Logs, reports and records of sessions on one disk.
  void _useSmallDisk() {
    _disk.emplace(_sandbox / "home/kept", "64m");
    if (_disk->error() != 0) throw std::runtime_error("no tmpfs can be mounted");
    _sandbox.stateRoot = _sandbox / "home/kept/state";
    _result.isReached = _point.number <= kMostBlocks;
    _result.call = "blocks";
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
    const bool isKilled = _result.isReached && (_point.harm == Harm::kill || _point.harm == Harm::tear);
    if (isKilled ? status != -SIGKILL : status < 0) {
      _result.violations.push_back("ended with " + std::to_string(status));
    } else if (!isKilled && status != 0) {
      _result.outcome += ": it says so";
      if (readFile(_sandbox.outputFile()).empty()) _result.violations.emplace_back("ended without a word");
    }
  }

  /// The agent that the service manager would start next, until nothing is left to do for it.
  void _recover() {
    if (_disk) _disk->leaveFree(kRoom);
    _isTold = readFile(_sandbox.outputFile()).find("No space left on device") != std::string::npos;
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
    std::vector<std::string> violations = _violationsOf(_told);
    if (!violations.empty() && _isTold && (_point.harm == Harm::disk || _point.harm == Harm::full)) {
      Told less = _told;
      less.confirmedEntries.clear();
      less.confirmedRecords.clear();
      less.confirmedHeaders.clear();
      less.mayLackEnds = true;
      violations = _violationsOf(less);
      _result.isLossTold = violations.empty();
    }
    for (const std::string& violation : violations) _result.violations.push_back(violation);
  }

  [[nodiscard]] std::vector<std::string> _violationsOf(const Told& told) const {
    Aftermath after(_sandbox);
    _scenario.check(after, told);
    after.checkArchives();
    after.checkStrays();
    return after.violations();
  }

  const Scenario& _scenario;
  const TrialPoint _point;
  AgentSandbox _sandbox;
  /// Where nothing may be mounted, it is no other file system.
  const SmallDisk _elsewhere{_sandbox / kFarDirectory, "1m"};
  std::optional<SmallDisk> _disk;
  bool _isTold = false;
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
