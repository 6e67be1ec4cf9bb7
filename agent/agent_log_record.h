#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace zal {

/// A log or event record as a client sent it; the views are borrowed for the call.
struct AgentLogRecord {
  std::optional<std::string_view> text{};      ///< absent or empty: no record at all
  std::int64_t level = 0;                      ///< the client's; recorded at kAgentRecordLevel all the same
  std::optional<std::string_view> category{};  ///< absent: "(No Category)"
  std::optional<std::string_view> sender{};    ///< absent: "(No Sender)"
  std::int32_t pid = 0;                        ///< of the client, from the kernel; not written
  std::optional<std::string_view> type{};      ///< absent: "ZalLogging"
  std::uint64_t time = 0;                      ///< the client's own timestamp, unchanged; 0: none
};

/// The severity of every client record, syslog's "informational".
inline constexpr int kAgentRecordLevel = 6;

/// Replaces `line` by "[sender:category] text"; its memory is reused.
void formatAgentLogLine(std::string& line, std::string_view sender, std::string_view category,
                        std::string_view text);

}  // namespace zal
