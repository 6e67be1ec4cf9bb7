#pragma once

#include <cstdint>
#include <string>

#include "tests/crash_points/trial.h"

namespace zal::testing {

struct SweepOptions {
  std::string scenario = "call";
  Harm harm = Harm::kill;
  std::uint64_t start = 0;  ///< the first point, from 1; 0: another one each time
  std::uint64_t every = 1;  ///< 1: all points
  unsigned jobs = 1;        ///< processes
  std::string of{};         ///< only system calls of that name are points; empty: all
};

struct SweepFigures {
  std::size_t points = 0;      ///< where the agent was harmed
  std::size_t confirmed = 0;   ///< of what clients told, over all points
  std::size_t failures = 0;    ///< points with a violation
  std::size_t told = 0;        ///< points where something found no room and the log says so
  std::uint64_t lastTold = 0;  ///< the last of them
};

/// Tries one point after the other until a run has none of that number. Prints each that fails.
[[nodiscard]] SweepFigures sweep(const SweepOptions& options);

}  // namespace zal::testing
