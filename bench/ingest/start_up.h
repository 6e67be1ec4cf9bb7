#pragma once

#include <filesystem>
#include <string>

#include "bench/support/child_process.h"

namespace zal::bench {

/// Seconds from the fork of a daemon to the first successful connection to its socket, asked for
/// without pause; below 0 when it never listens. The daemon is stopped afterwards.
[[nodiscard]] double measureStartUp(const ChildProcess::Options& daemon, const std::filesystem::path& socket);

}  // namespace zal::bench
