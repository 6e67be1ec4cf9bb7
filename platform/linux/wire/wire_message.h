#pragma once

#include <forward_list>
#include <optional>
#include <string>

#include "platform/ipc_message.h"
#include "platform/linux/wire/flex_value.h"
#include "platform/linux/wire/frame_decoder.h"

namespace zal {

/// One request in the bytes it came in: texts are views into the payload, which outlives it. Only a
/// text that was not UTF-8 gets a copy, with U+FFFD in it.
class WireMessage final : public Message {
 public:
  /// Nothing when the payload is not well-formed throughout, or its root is no map.
  [[nodiscard]] static std::optional<WireMessage> fromFrame(const Frame& frame);

  [[nodiscard]] std::optional<std::string_view> string(std::string_view key) const override;
  [[nodiscard]] std::int64_t int64(std::string_view key) const override;
  [[nodiscard]] std::uint64_t uint64(std::string_view key) const override;
  [[nodiscard]] double real(std::string_view key) const override;
  [[nodiscard]] std::optional<ValueMap> dictionary(std::string_view key) const override;
  [[nodiscard]] std::optional<Number> codedNumber(std::string_view key) const override;
  [[nodiscard]] std::string description() const override;
  [[nodiscard]] std::optional<std::uint64_t> replyToken() const override { return _replyToken; }

 private:
  WireMessage(const FlexMap& map, std::optional<std::uint64_t> replyToken)
      : _map(map), _replyToken(replyToken) {}

  [[nodiscard]] FlexValue _find(std::string_view key) const { return _map.find(key, _lastKey); }

  FlexMap _map;
  mutable FlexMap::Place _lastKey;
  std::optional<std::uint64_t> _replyToken;
  mutable std::forward_list<std::string> _replaced;  // stays put, so that views into it live on
};

}  // namespace zal
