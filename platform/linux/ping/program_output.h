#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace zal {

/// The line of a ping program's output that sums up, and the two counts at its beginning.
struct ProgramSummary {
  std::string line;
  std::uint64_t transmitted = 0;
  std::uint64_t received = 0;
};

/// Finds "3 packets transmitted, 2 received, ..." ("2 packets received" too); the last one counts.
[[nodiscard]] std::optional<ProgramSummary> parseProgramOutput(std::string_view output);
/// The last line with anything in it: what a program that failed had to say.
[[nodiscard]] std::string lastLine(std::string_view output);

}  // namespace zal
