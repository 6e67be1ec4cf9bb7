#include "platform/linux/bus/door/bus_request.h"

#include <utility>

#include "platform/linux/wire/flex_verifier.h"
#include "platform/linux/wire/message_builder.h"
#include "platform/linux/wire/message_description.h"

namespace zal {

std::optional<std::string_view> BusRequest::string(std::string_view key) const {
  const auto* text = _find<std::string>(key);
  return text != nullptr ? std::optional<std::string_view>(*text) : std::nullopt;
}

std::int64_t BusRequest::int64(std::string_view key) const {
  if (const auto* number = _find<std::int64_t>(key)) return *number;
  const auto* positive = _find<std::uint64_t>(key);
  return positive != nullptr && std::in_range<std::int64_t>(*positive) ? static_cast<std::int64_t>(*positive)
                                                                       : 0;
}

std::uint64_t BusRequest::uint64(std::string_view key) const {
  if (const auto* number = _find<std::uint64_t>(key)) return *number;
  const auto* whole = _find<std::int64_t>(key);
  return whole != nullptr && *whole >= 0 ? static_cast<std::uint64_t>(*whole) : 0;
}

double BusRequest::real(std::string_view key) const {
  const auto* number = _find<double>(key);
  return number != nullptr ? *number : 0.0;
}

std::optional<ValueMap> BusRequest::dictionary(std::string_view key) const {
  const auto* map = _find<ValueMap>(key);
  return map != nullptr ? std::optional(*map) : std::nullopt;
}

std::optional<Number> BusRequest::codedNumber(std::string_view key) const {
  if (const auto* number = _find<std::int64_t>(key)) return *number;
  if (const auto* number = _find<std::uint64_t>(key)) return *number;
  if (const auto* number = _find<double>(key)) return *number;
  if (const auto* number = _find<bool>(key)) return *number;
  return std::nullopt;
}

std::string BusRequest::description() const {
  const std::string bytes = encodeDictionary(_values);
  const auto root = verifiedFlexRoot(bytes);
  const auto map = root ? root->asMap() : std::nullopt;
  return map ? messageDescription(*map) : "{…}";
}

}  // namespace zal
