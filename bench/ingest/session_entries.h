#pragma once

#include <cstdint>
#include <filesystem>
#include <string>

namespace zal::bench {

/// Entries of one session, from a client through the library until its barrier is answered.
struct SessionEntryFigures {
  double perSecond = 0, perSecondWithout = 0;                        ///< with the black box, and switched off
  double cpuSecondsPerMillion = 0, cpuSecondsPerMillionWithout = 0;  ///< of the agent
  std::string missing;                                               ///< why there are no figures
};

/// Medians of so many runs of each, by turns.
[[nodiscard]] SessionEntryFigures measureSessionEntries(const std::filesystem::path& programs,
                                                        std::uint64_t entries, unsigned rounds);

}  // namespace zal::bench
