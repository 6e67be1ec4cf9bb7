#pragma once

#include <cstdint>
#include <filesystem>
#include <string>

namespace zal::bench {

/// A session that is too long for memory, from its begin until its files are written and read again.
struct LongSessionFigures {
  double peakMebibytes = 0;  ///< the most that was resident of the agent at any time
  double perSecond = 0;      ///< entries, until the barrier behind the last one is answered
  double secondsToEnd = 0;   ///< from the end until its record is gone
  double longestAnswer = 0;  ///< seconds: of the barriers that another client sends meanwhile
  std::string missing;       ///< why there are no figures
};

/// Fails unless the verbose log has each entry once and in order. Needs some 600 bytes of room an entry.
[[nodiscard]] LongSessionFigures measureLongSession(const std::filesystem::path& programs,
                                                    std::uint64_t entries);

/// Such a session whose agent is killed, and what the next one needs to write it.
struct RecoveredSessionFigures {
  double peakMebibytes = 0;  ///< the most that was resident of the next one
  double seconds = 0;        ///< from its start until it listens
  std::string missing;       ///< why there are no figures
};

/// Fails under the same conditions.
[[nodiscard]] RecoveredSessionFigures measureRecoveredSession(const std::filesystem::path& programs,
                                                              std::uint64_t entries);

}  // namespace zal::bench
