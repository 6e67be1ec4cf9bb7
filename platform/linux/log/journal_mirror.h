#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "platform/agent_log.h"
#include "platform/clock.h"
#include "platform/linux/log/journal_queue.h"
#include "platform/linux/log/journal_socket.h"
#include "platform/log_facility.h"
#include "platform/main_thread_check.h"
#include "platform/run_loop.h"

namespace zal {

/// Copies of records for the journal, where there is one. The files have every record; this one gives
/// way: it sends only when the loop is about to sleep and never waits. What the journal does not take
/// in time, or what comes faster than it is to be troubled with, is left out and counted, and said in
/// one warning when the flood or the outage is over. Without a journal nothing is encoded, and it is
/// looked for once a second at most, and only when records come. Main thread only.
///
///            record            sleep              full for a second, or nobody listens
///     absent -------> working -------> (sent)     working ------------> stalled or absent
///        ^  a look a second, with a record, leads back  |
///        +----------------------------------------------+
class JournalMirror {
 public:
  /// All borrowed; they outlive this.
  struct Host {
    Clock& clock;
    RunLoop& mainLoop;
    AgentLog& log;
  };
  JournalMirror(Host host, std::string socketPath);
  JournalMirror(const JournalMirror&) = delete;
  JournalMirror& operator=(const JournalMirror&) = delete;

  void record(const LogRecord& record);
  /// For the end of the process: sends what goes at once, and says how many were left out.
  void flush();

 private:
  enum class State {
    absent,   ///< nobody listens
    working,  ///< records go there, or wait for a moment
    stalled,  ///< somebody listens and takes nothing
  };

  [[nodiscard]] bool _maySend();
  void _beforeSleep();
  void _send();
  void _sendWhatGoes();
  void _awaitRoom(SteadyTime now);
  void _leaveOut(State state, std::string_view why);
  void _giveUpQueue();
  [[nodiscard]] std::size_t _allowance(SteadyTime now);
  void _armRetry();
  void _armReport();
  void _report();
  void _sayMissed();
  void _say(std::string_view text);

  Host _host;
  const std::string _path;
  JournalSocket _socket;
  JournalQueue _queue;
  State _state = State::absent;
  bool _wasThere = false;   // a host that never had a journal misses nothing
  bool _hasLooked = false;  // since the loop last slept
  SteadyTime _lastLook = SteadyTime::min();
  bool _isFull = false;
  SteadyTime _fullSince{};
  SteadyTime _windowStart = SteadyTime::min();
  std::size_t _sentInWindow = 0;
  std::uint64_t _missed = 0;
  std::uint64_t _missedBefore = 0;  // at the last look whether the flood is over
  bool _isSaying = false;
  ScopedTimer _retry;
  ScopedTimer _reportTimer;
  ScopedTimer _sayTimer;
  MainThreadCheck _mainThread;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);
};

}  // namespace zal
