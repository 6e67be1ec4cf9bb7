#pragma once

#include <string>
#include <string_view>

#include "platform/clock.h"

namespace zal::tessel {

/// One message of a log that keeps its parts apart. Nothing in it is trusted.
struct Record {
  WallTime time{};
  std::string host;
  std::string name;     ///< of whoever wrote it
  std::string process;  ///< its id; empty where there is none
  std::string text;
};

/// "Nov 21 17:34:18.123", local time.
[[nodiscard]] std::string timeText(WallTime time, const Clock& clock);

/// "Nov 21 17:34:18.123 host name[pid]: text" with its line end. Control characters are escaped and
/// further lines of the text marked, so that no message passes for another.
[[nodiscard]] std::string recordLine(const Record& record, const Clock& clock);

}  // namespace zal::tessel
