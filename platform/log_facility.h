#pragma once

#include <cstdint>
#include <string_view>

namespace zal {

/// One record for the host logging facility; the views are borrowed for the call.
struct LogRecord {
  int level = 6;                    ///< severity as syslog counts it (RFC 5424): 6 informational
  std::string_view type;            ///< names the log set, as a client gave it: not yet safe in a path
  std::string_view category;        ///< the type, or the type followed by "-Event"
  bool processInformation = false;  ///< put the agent's name and process id before the line
  std::string_view line;            ///< UTF-8, may hold several lines
  std::uint64_t time = 0;           ///< the client's own timestamp, unchanged; 0: none
};

/// Where client records and the agent's own lines are kept: one log set per type. Main thread only.
class PlatformLogFacility {
 public:
  virtual ~PlatformLogFacility() = default;
  /// Accepts the record. It is in its file before the run loop next sleeps; what the disk refuses
  /// is counted and said in one warning per set.
  virtual void record(const LogRecord& record) = 0;
  /// Hands everything accepted to the kernel now.
  virtual void flush() = 0;
};

}  // namespace zal
