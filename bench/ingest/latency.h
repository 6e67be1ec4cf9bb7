#pragma once

#include <string>
#include <vector>

#include "bench/servers/log_server.h"

namespace zal::bench {

/// Sends one record after the other at a low rate and takes, for each, the seconds from before the send
/// to the moment the record is seen in the server's file. Returned: what went wrong, or nothing.
[[nodiscard]] std::string measureLatency(LogServer& server, const std::filesystem::path& folder,
                                         unsigned records, std::vector<double>& seconds);

}  // namespace zal::bench
