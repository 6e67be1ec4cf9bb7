#pragma once

#include <chrono>
#include <string>
#include <vector>

#include "platform/linux/helper/patience.h"

namespace zal::helper {

struct ProgramLimits {
  std::chrono::milliseconds time{5000};
  std::size_t bytes = std::size_t{4} << 20U;  ///< of its output; what it says beyond is dropped
};

/// What a program said. Without trouble it ended with status 0.
struct ProgramOutcome {
  std::string output;
  std::string errors;   ///< what it said on its standard error, at most 4096 bytes
  std::string trouble;  ///< in half a sentence: not installed, cut off, ended with another status
};

/// Runs the program, looked for in PATH, and waits for its end, at most so long. One that has not
/// ended by then, or when the patience is over, is killed together with its own children. What those
/// children say after its end is not waited for.
[[nodiscard]] ProgramOutcome runBounded(const std::vector<std::string>& command, Patience& patience,
                                        const ProgramLimits& limits = {});

/// Once, at the start: programs are looked for in that search path; when it is empty, in the usual one
/// and behind it where administrators' tools lie, which an ordinary user's path lacks.
void searchForToolsIn(const std::string& path);

}  // namespace zal::helper
