#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <string_view>

#include "platform/clock.h"
#include "session/time_zone_cache.h"

namespace zal {

/// Makes the time text of entries, "14:03:07.251  (2024-05-02) (CEST)". Taking a moment apart in the
/// local zone is dear and entries come many a second, so the last second's text is kept. Main thread only.
class EntryTimeText {
 public:
  EntryTimeText(const Clock& clock, TimeZoneCache& timeZone) : _clock(clock), _timeZone(timeZone) {}
  /// Valid until the next call.
  [[nodiscard]] std::string_view text(WallTime moment);

 private:
  const Clock& _clock;
  TimeZoneCache& _timeZone;
  std::optional<std::chrono::sys_seconds> _second;
  std::string _text;
};

}  // namespace zal
