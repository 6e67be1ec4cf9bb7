#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

#include <flatbuffers/flexbuffers.h>

#include "platform/linux/wire/little_endian.h"

namespace zal {

class FlexMap;
class FlexList;

/// One value inside a FlexBuffers buffer that verifiedFlexRoot() accepted, asked by its exact type:
/// nothing is converted. A view: the buffer outlives it. Reads bytes, so the buffer may lie anywhere.
class FlexValue {
 public:
  FlexValue() = default;
  /// `at`: where the value, or the offset to it, stands, in `parentWidth` bytes.
  FlexValue(const char* at, std::uint8_t parentWidth, std::uint8_t packedType)
      : _at(at), _parentWidth(parentWidth), _packed(packedType) {}

  [[nodiscard]] flexbuffers::Type type() const { return static_cast<flexbuffers::Type>(_packed >> 2U); }

  // Each gives nothing when the value is of another type. Direct and indirect numbers are one type.
  [[nodiscard]] std::optional<std::int64_t> asInt() const {
    if (type() == flexbuffers::FBT_INT) return _signed(_at, _parentWidth);
    if (type() == flexbuffers::FBT_INDIRECT_INT) return _signed(_target(), _width());
    return std::nullopt;
  }
  [[nodiscard]] std::optional<std::uint64_t> asUInt() const {
    if (type() == flexbuffers::FBT_UINT) return loadLittle(_at, _parentWidth);
    if (type() == flexbuffers::FBT_INDIRECT_UINT) return loadLittle(_target(), _width());
    return std::nullopt;
  }
  [[nodiscard]] std::optional<double> asFloat() const;
  [[nodiscard]] std::optional<bool> asBool() const;
  /// Any bytes, not only UTF-8.
  [[nodiscard]] std::optional<std::string_view> asString() const {
    if (type() != flexbuffers::FBT_STRING) return std::nullopt;
    return _counted();
  }
  [[nodiscard]] std::optional<std::string_view> asBlob() const {
    if (type() != flexbuffers::FBT_BLOB) return std::nullopt;
    return _counted();
  }
  [[nodiscard]] std::optional<std::string_view> asKey() const;
  [[nodiscard]] std::optional<FlexMap> asMap() const;
  [[nodiscard]] std::optional<FlexList> asList() const;  ///< every kind of vector

 private:
  [[nodiscard]] std::uint8_t _width() const { return static_cast<std::uint8_t>(1U << (_packed & 3U)); }
  [[nodiscard]] static std::int64_t _signed(const char* from, std::size_t width) {
    const auto unused = 64U - 8U * static_cast<unsigned>(width);
    return static_cast<std::int64_t>(loadLittle(from, width) << unused) >> unused;
  }
  [[nodiscard]] const char* _target() const { return _at - loadLittle(_at, _parentWidth); }
  [[nodiscard]] std::string_view _counted() const {
    const char* start = _target();
    return {start, loadLittle(start - _width(), _width())};
  }

  const char* _at = nullptr;
  std::uint8_t _parentWidth = 1;
  std::uint8_t _packed = flexbuffers::PackedType(flexbuffers::BIT_WIDTH_8, flexbuffers::FBT_NULL);
};

/// The elements of a vector, typed or not, in order.
class FlexList {
 public:
  FlexList(const char* elements, std::size_t size, std::uint8_t width, std::optional<flexbuffers::Type> typed)
      : _elements(elements), _size(size), _width(width), _typed(typed) {}
  [[nodiscard]] std::size_t size() const { return _size; }
  /// `index` is below size().
  [[nodiscard]] FlexValue operator[](std::size_t index) const;

 private:
  const char* _elements;
  std::size_t _size;
  std::uint8_t _width;
  std::optional<flexbuffers::Type> _typed;
};

/// Keys and values of a map. Keys have to be sorted by their bytes: find() searches by halving, and
/// in a map that breaks the rule (or repeats a key) it may find any of them or none, never more.
class FlexMap {
 public:
  explicit FlexMap(const char* values, std::uint8_t width);
  [[nodiscard]] std::size_t size() const { return _size; }
  [[nodiscard]] std::string_view key(std::size_t index) const;
  [[nodiscard]] FlexValue value(std::size_t index) const {
    return {_values + index * _width, _width, static_cast<std::uint8_t>(_types[index])};
  }
  [[nodiscard]] FlexValue find(std::string_view key) const;  ///< absent: a null value
  /// Where a key was found.
  struct Place {
    std::size_t index = static_cast<std::size_t>(-1);  ///< so that the first one is the next
    std::size_t keySize = static_cast<std::size_t>(-1);
  };
  /// The same with a first look at where the last one was found and behind it; remembers where it was.
  /// Who asks for keys in the order of their bytes finds each at once.
  [[nodiscard]] FlexValue find(std::string_view key, Place& last) const;

 private:
  [[nodiscard]] const char* _keyAt(std::size_t index) const {
    const char* at = _keys + index;
    if (_keyWidth == 1) return at - static_cast<unsigned char>(*at);  // nearly always
    at = _keys + index * _keyWidth;
    return at - loadLittle(at, _keyWidth);
  }
  [[nodiscard]] bool _isKey(std::size_t index, std::string_view wanted) const;
  /// size() when there is none.
  [[nodiscard]] std::size_t _indexOf(std::string_view key) const;

  const char* _values;
  const char* _types;
  const char* _keys;
  std::size_t _size;
  std::uint8_t _width;
  std::uint8_t _keyWidth;
};

}  // namespace zal
