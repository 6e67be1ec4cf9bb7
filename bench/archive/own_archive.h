#pragma once

#include <string>

#include "platform/configuration.h"

namespace zal::bench {

/// One archive by the agent's own service on its own loop and queues, from the job's start to its
/// completion. Returned: whether the archive is there.
[[nodiscard]] bool makeOwnArchive(const std::string& directory, const std::string& output,
                                  ArchiveCompression compression);

}  // namespace zal::bench
