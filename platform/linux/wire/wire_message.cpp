#include "platform/linux/wire/wire_message.h"

#include "platform/linux/wire/flex_conversion.h"
#include "platform/linux/wire/flex_verifier.h"
#include "platform/linux/wire/message_description.h"
#include "platform/linux/wire/utf8.h"

namespace zal {

std::optional<WireMessage> WireMessage::fromFrame(const Frame& frame) {
  const auto root = verifiedFlexRoot(frame.payload);
  const auto map = root ? root->asMap() : std::nullopt;
  if (!map) return std::nullopt;
  const bool answered = frame.header.kind == FrameKind::messageExpectingReply;
  return WireMessage(*map, answered ? std::optional(frame.header.cookie) : std::nullopt);
}

std::optional<std::string_view> WireMessage::string(std::string_view key) const {
  const auto text = _find(key).asString();
  if (!text || isUtf8(*text)) return text;
  return _replaced.emplace_front(replacedUtf8(*text));
}

std::int64_t WireMessage::int64(std::string_view key) const { return _find(key).asInt().value_or(0); }

std::uint64_t WireMessage::uint64(std::string_view key) const { return _find(key).asUInt().value_or(0); }

double WireMessage::real(std::string_view key) const { return _find(key).asFloat().value_or(0.0); }

std::optional<ValueMap> WireMessage::dictionary(std::string_view key) const {
  const auto map = _find(key).asMap();
  return map ? convertedMap(*map) : std::nullopt;
}

std::optional<Number> WireMessage::codedNumber(std::string_view key) const {
  const auto blob = _find(key).asBlob();
  const auto content = blob ? decodedScalar(*blob) : std::nullopt;
  if (!content) return std::nullopt;
  if (const auto* number = content->as<std::int64_t>()) return *number;
  if (const auto* number = content->as<std::uint64_t>()) return *number;
  if (const auto* number = content->as<double>()) return *number;
  if (const auto* number = content->as<bool>()) return *number;
  return std::nullopt;
}

std::string WireMessage::description() const { return messageDescription(_map); }

}  // namespace zal
