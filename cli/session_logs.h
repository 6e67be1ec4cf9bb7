#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cli/session_tree.h"

namespace zal {

enum class SessionLog { simple, verbose, quality };

/// The path of one of the session's three logs; nothing when it was not written.
[[nodiscard]] std::optional<std::string> sessionLogPath(const SessionDirectory& session, SessionLog log);
/// Nothing when the file cannot be read.
[[nodiscard]] std::optional<std::string> readFileText(const std::string& path);

/// A metric over its whole session, as the quality log says it.
struct MetricBlock {
  std::string name;
  std::string average, minimum, maximum, median, standardDeviation;
  std::string text;  ///< the block's seven lines as they stand in the file
};

/// The statistics blocks in a quality log's text, in its order.
[[nodiscard]] std::vector<MetricBlock> statisticsBlocks(std::string_view qualityLog);

}  // namespace zal
