#pragma once

#include <filesystem>
#include <string>

namespace zal::bench {

/// What a dump costs those who did not ask for it, and those who did.
struct DumpFigures {
  std::string missing;        ///< why there are no figures; empty when there are
  double usualAnswer = 0;     ///< seconds: median of another client's barriers with nothing else going on
  double longestAnswer = 0;   ///< seconds: the longest one while a dump was being started and taken
  double requestToReply = 0;  ///< seconds from asking for the dump to the reply that names its archive
};

/// Takes one dump (flags 0x5F: network, registration, push, baseband and system logs) of a fresh agent, while
/// another client asks for barriers without a pause. `closingDelay` replaces the agent's 8 seconds
/// between the closing stages; 0 leaves them.
[[nodiscard]] DumpFigures measureDump(const std::filesystem::path& programs, double closingDelay);

}  // namespace zal::bench
