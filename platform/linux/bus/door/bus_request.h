#pragma once

#include <utility>

#include "platform/ipc_message.h"

namespace zal {

/// A request as a bus caller wrote it. Whole numbers of any width do for each other where they fit, for
/// tools guess the width; nothing else is converted.
class BusRequest final : public Message {
 public:
  BusRequest(ValueMap values, std::optional<std::uint64_t> replyToken)
      : _values(std::move(values)), _replyToken(replyToken) {}

  [[nodiscard]] std::optional<std::string_view> string(std::string_view key) const override;
  [[nodiscard]] std::int64_t int64(std::string_view key) const override;
  [[nodiscard]] std::uint64_t uint64(std::string_view key) const override;
  [[nodiscard]] double real(std::string_view key) const override;
  [[nodiscard]] std::optional<ValueMap> dictionary(std::string_view key) const override;
  [[nodiscard]] std::optional<Number> codedNumber(std::string_view key) const override;
  [[nodiscard]] std::string description() const override;
  [[nodiscard]] std::optional<std::uint64_t> replyToken() const override { return _replyToken; }

 private:
  template <class T>
  [[nodiscard]] const T* _find(std::string_view key) const {
    const auto place = _values.find(key);
    return place != _values.end() ? place->second.as<T>() : nullptr;
  }

  ValueMap _values;
  std::optional<std::uint64_t> _replyToken;
};

}  // namespace zal
