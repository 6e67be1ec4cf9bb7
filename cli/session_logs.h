#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cli/session_tree.h"

namespace zal {

enum class SessionLog { simple, verbose, quality };

/// One of the session's three logs by its path below the session; nothing when it was not written.
[[nodiscard]] std::optional<std::string> sessionLogName(const SessionDirectory& session, SessionLog log);
/// A file of the session, whole; nothing when it cannot be read.
[[nodiscard]] std::optional<std::string> readSessionFile(const SessionDirectory& session,
                                                         const std::string& name, ArchiveReader& archives);

/// A metric over its whole session, as the quality log says it.
struct MetricBlock {
  std::string name;
  std::string average, minimum, maximum, median, standardDeviation;
  std::string text;  ///< the block's seven lines as they stand in the file
};

/// The statistics blocks in a quality log's text, in its order.
[[nodiscard]] std::vector<MetricBlock> statisticsBlocks(std::string_view qualityLog);

}  // namespace zal
