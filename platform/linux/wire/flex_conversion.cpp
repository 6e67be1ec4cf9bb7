#include "platform/linux/wire/flex_conversion.h"

#include <string>
#include <utility>

#include "platform/linux/wire/flex_verifier.h"
#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

std::string validText(std::string_view text) { return isUtf8(text) ? std::string(text) : replacedUtf8(text); }

std::optional<Value> scalar(const FlexValue& value) {
  if (value.type() == flexbuffers::FBT_NULL) return Value();
  if (const auto number = value.asInt()) return Value(*number);
  if (const auto number = value.asUInt()) return Value(*number);
  if (const auto number = value.asFloat()) return Value(*number);
  if (const auto boolean = value.asBool()) return Value(*boolean);
  return std::nullopt;
}

class Converter {
 public:
  std::optional<Value> value(const FlexValue& from) {
    if (++_values > kMaximumDictionaryValues) _beyond = true;
    if (_beyond) return std::nullopt;
    if (auto number = scalar(from)) return number;
    if (const auto string = from.asString()) return _text(*string);
    if (const auto key = from.asKey()) return _text(*key);
    if (const auto map = from.asMap()) return Value(this->map(*map));
    if (const auto list = from.asList()) return Value(_list(*list));
    if (const auto blob = from.asBlob(); blob && _takes(blob->size())) return decodedScalar(*blob);
    return std::nullopt;
  }

  ValueMap map(const FlexMap& from) {
    ValueMap out;
    for (std::size_t i = 0; i < from.size() && !_beyond; ++i) {
      const std::string_view key = from.key(i);
      if (!_takes(key.size())) break;
      if (auto converted = value(from.value(i))) out.try_emplace(validText(key), *std::move(converted));
    }
    return out;
  }

  [[nodiscard]] bool beyond() const { return _beyond; }

 private:
  bool _takes(std::size_t bytes) {
    _textBytes += bytes;
    if (_textBytes > kMaximumDictionaryText) _beyond = true;
    return !_beyond;
  }

  std::optional<Value> _text(std::string_view text) {
    if (!_takes(text.size())) return std::nullopt;
    return Value(validText(text));
  }

  ValueList _list(const FlexList& from) {
    ValueList out;
    for (std::size_t i = 0; i < from.size() && !_beyond; ++i) {
      auto converted = value(from[i]);
      out.push_back(converted ? *std::move(converted) : Value());
    }
    return out;
  }

  std::size_t _values = 0;
  std::size_t _textBytes = 0;
  bool _beyond = false;
};

}  // namespace

std::optional<ValueMap> convertedMap(const FlexMap& map) {
  Converter converter;
  ValueMap out = converter.map(map);
  if (converter.beyond()) return std::nullopt;
  return out;
}

std::optional<Value> decodedScalar(std::string_view blob) {
  const auto root = verifiedFlexRoot(blob);
  if (!root) return std::nullopt;
  if (const auto string = root->asString()) return Value(validText(*string));
  return scalar(*root);
}

}  // namespace zal
