#pragma once

#include <filesystem>
#include <string>

#include "bench/support/child_process.h"
#include "bench/support/scratch_folder.h"
#include "bench/support/timing.h"
#include "client/lirra.hpp"

namespace zal::bench {

struct SessionCost {
  double atRest = 0;            ///< mebibytes, resident: it listens, and has done nothing yet
  double inSession = 0;         ///< the same, at the end of the idle session
  double cpuSecondsAnHour = 0;  ///< of the session, scaled from what was measured
};

/// An agent in a session of which nothing is said: it samples the signals, and that is all.
class IdleSession {
 public:
  /// `bus` is the system bus's address; empty: there is none. Throws when the agent does not run.
  IdleSession(const std::filesystem::path& programs, const std::string& bus);

  /// Waits until the session has lasted so long.
  [[nodiscard]] SessionCost costAfter(double seconds);
  [[nodiscard]] std::string socketPath() const;

 private:
  ScratchFolder _folder;
  ChildProcess _agent;
  lirra::Client _client;
  SessionCost _cost;
  double _cpuBefore = 0;
  Stopwatch _since;
};

}  // namespace zal::bench
