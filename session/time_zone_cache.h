#pragma once

#include <optional>
#include <string>

#include "platform/clock.h"

namespace zal {

/// The local zone's abbreviation, asked for once. The entry makes one for the whole process, so that
/// every name of a run carries the same zone whatever the host changes meanwhile. Main thread only.
class TimeZoneCache {
 public:
  /// "Unknown" when the zone has none.
  [[nodiscard]] const std::string& abbreviation(const Clock& clock) {
    if (!_abbreviation) {
      _abbreviation = clock.zoneAbbreviation();
      if (_abbreviation->empty()) _abbreviation = "Unknown";
    }
    return *_abbreviation;
  }

 private:
  std::optional<std::string> _abbreviation;
};

}  // namespace zal
