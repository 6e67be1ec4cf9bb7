#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "tests/crash_points/scenario.h"

namespace zal::testing {

/// What is done to the agent at one of its system calls.
enum class Harm {
  kill,   ///< it ends before the call
  tear,   ///< it ends in the middle of the write; only writes count
  fault,  ///< the call fails
  disk,   ///< the disk has so many blocks of 4 KiB left
  full,   ///< half of a write fits on the disk, then nothing any more; only writes count
};

/// One point of a sweep.
struct TrialPoint {
  Harm harm = Harm::kill;
  std::uint64_t number = 1;  ///< of the call, from 1
  std::size_t error = 0;     ///< which of those that the call can fail with
  std::string of{};          ///< only calls of that name count; empty: all
};

struct TrialResult {
  bool isReached = false;  ///< there was such a call
  std::string call;        ///< its name, and what it failed with
  std::size_t errors = 0;  ///< how many the call can fail with
  std::size_t confirmed = 0;
  std::string outcome;  ///< how the harmed agent ended
  /// Something confirmed did not find room on the disk, and the agent's log says that there was none.
  bool isLossTold = false;
  std::vector<std::string> violations;
};

/// Plays the scenario to an agent that is harmed at that point, starts another one in its place, lets it
/// end, and looks at what is left. `keepIn`: where everything is copied for people to look at; or empty.
[[nodiscard]] TrialResult tryPoint(const Scenario& scenario, const TrialPoint& point,
                                   const std::string& keepIn);

}  // namespace zal::testing
