#pragma once

#include <cstdint>
#include <optional>

#include "platform/clock.h"
#include "platform/value.h"
#include "session/optional_text.h"

namespace zal {

/// What a session takes. The numbers stand in records of the black box: they stay, and new ones join.
enum class SessionEntryKind : std::uint8_t {
  opened = 1,          ///< no entry: says whose record it is; text: session type
  begin = 2,           ///< sender
  end = 3,             ///< sender
  checkpoint = 4,      ///< text: checkpoint; time, sender
  description = 5,     ///< text: description; log, time, sender
  quality = 6,         ///< text: category; log, sender
  metric = 7,          ///< text: name; value, sender
  sample = 8,          ///< the same, taken by the session itself: no sign of a client's life
  callInfo = 9,        ///< text: value; log: category; sender
  file = 10,           ///< text: path; log: category
  initiator = 11,      ///< text
  recipient = 12,      ///< text
  failureReason = 13,  ///< text
  role = 14,           ///< value: whether this device is the initiator
  // What an ended session still has, and a new one of the same object goes on with.
  keptCallInfo = 15,  ///< as callInfo
  keptMetric = 16,    ///< as metric
};
inline constexpr SessionEntryKind kLastSessionEntryKind = SessionEntryKind::keptMetric;

/// One thing that a session took; what its kind does not have is absent. Texts are borrowed.
struct SessionEntry {
  SessionEntryKind kind{};
  WallTime at{};  ///< when it was taken
  OptionalText text{}, log{}, sender{};
  double time = 0;  ///< the client's own, seconds since 1970
  std::optional<Number> value{};
};

}  // namespace zal
