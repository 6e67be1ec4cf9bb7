#pragma once

#include <cstdint>
#include <string>

#include "bench/servers/log_server.h"

namespace zal::bench {

/// What one run of many records through a server cost.
struct IngestResult {
  double recordsPerSecond = 0;      ///< from the first record sent to the last one stored
  double cpuSecondsPerMillion = 0;  ///< of the server, user and system
  double residentAtRest = 0;        ///< MiB, listening, before anything came
  double residentAfter = 0;         ///< MiB, with all records stored and their clients still there
  double proportionalAfter = 0;     ///< MiB, pages shared with others counted by share
};

/// Starts the server in the folder, sends that many records from that many clients at once, each in a
/// thread of its own, waits until all are stored, counts them by reading, and stops it. Returned: what
/// went wrong, or nothing.
[[nodiscard]] std::string measureIngest(LogServer& server, const std::filesystem::path& folder,
                                        unsigned clients, std::uint64_t records, IngestResult& result);

}  // namespace zal::bench
