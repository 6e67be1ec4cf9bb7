#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "platform/value.h"

namespace zal {

/// One request as it came in: a dictionary of typed values. A value of another type than the one
/// asked for reads as absent. Valid only during the event that delivers it; the views it hands out
/// live as long as it does. Text is always valid UTF-8: what was not has become U+FFFD.
class Message {
 public:
  virtual ~Message() = default;
  [[nodiscard]] virtual std::optional<std::string_view> string(std::string_view key) const = 0;
  [[nodiscard]] virtual std::int64_t int64(std::string_view key) const = 0;    ///< absent: 0
  [[nodiscard]] virtual std::uint64_t uint64(std::string_view key) const = 0;  ///< absent: 0
  [[nodiscard]] virtual double real(std::string_view key) const = 0;           ///< absent: 0.0
  [[nodiscard]] virtual std::optional<ValueMap> dictionary(std::string_view key) const = 0;
  /// A coded value whose content is a number; every other content reads as absent.
  [[nodiscard]] virtual std::optional<Number> codedNumber(std::string_view key) const = 0;
  /// All of it, printable, one line. Costly: only for logs that are switched on.
  [[nodiscard]] virtual std::string description() const = 0;
  /// The token that a reply to this message repeats, or nothing when none is expected.
  [[nodiscard]] virtual std::optional<std::uint64_t> replyToken() const = 0;
};

}  // namespace zal
