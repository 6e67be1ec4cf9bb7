#include "platform/linux/wire/flex_value.h"

#include <bit>

namespace zal {
namespace {

using flexbuffers::Type;

double loadFloat(const char* from, std::size_t width) {
  const std::uint64_t bits = loadLittle(from, width);
  return width == 4 ? std::bit_cast<float>(static_cast<std::uint32_t>(bits)) : std::bit_cast<double>(bits);
}

/// Below, equal or above zero as the key that ends in a zero byte stands to the wanted one.
int compareKey(const char* key, std::string_view wanted) {
  for (const char character : wanted) {
    const auto have = static_cast<unsigned char>(*key++);
    const auto want = static_cast<unsigned char>(character);
    if (have == 0 || have < want) return -1;
    if (have > want) return 1;
  }
  return *key == 0 ? 0 : 1;
}

constexpr std::uint64_t kOnes = 0x0101010101010101U;

/// Whether `width` bytes, 4 or 8, are the same in both, and none of them is zero.
bool areSameNonZero(const char* left, const char* right, std::size_t width) {
  const std::uint64_t ones = kOnes >> (64U - 8U * width);
  const std::uint64_t word = loadLittle(left, width);
  return word == loadLittle(right, width) && ((word - ones) & ~word & (ones << 7U)) == 0;
}

/// Whether a text stands there without a zero byte in it. Without a call, for what is as short as keys are.
bool startsWith(const char* bytes, std::string_view text) {
  const char* wanted = text.data();
  const std::size_t size = text.size();
  if (size >= 8) {
    for (std::size_t at = 0; at + 8 < size; at += 8) {
      if (!areSameNonZero(bytes + at, wanted + at, 8)) return false;
    }
    return areSameNonZero(bytes + size - 8, wanted + size - 8, 8);
  }
  if (size >= 4) {
    return areSameNonZero(bytes, wanted, 4) && areSameNonZero(bytes + size - 4, wanted + size - 4, 4);
  }
  for (std::size_t at = 0; at < size; ++at) {
    if (bytes[at] != wanted[at] || bytes[at] == 0) return false;
  }
  return true;
}

}  // namespace

std::optional<double> FlexValue::asFloat() const {
  if (type() == flexbuffers::FBT_FLOAT) return loadFloat(_at, _parentWidth);
  if (type() == flexbuffers::FBT_INDIRECT_FLOAT) return loadFloat(_target(), _width());
  return std::nullopt;
}

std::optional<bool> FlexValue::asBool() const {
  if (type() != flexbuffers::FBT_BOOL) return std::nullopt;
  return loadLittle(_at, _parentWidth) != 0;
}

std::optional<std::string_view> FlexValue::asKey() const {
  if (type() != flexbuffers::FBT_KEY) return std::nullopt;
  return std::string_view(_target());
}

std::optional<FlexMap> FlexValue::asMap() const {
  if (type() != flexbuffers::FBT_MAP) return std::nullopt;
  return FlexMap(_target(), _width());
}

std::optional<FlexList> FlexValue::asList() const {
  if (flexbuffers::IsFixedTypedVector(type())) {
    std::uint8_t size = 0;
    const Type element = flexbuffers::ToFixedTypedVectorElementType(type(), &size);
    return FlexList(_target(), size, _width(), element);
  }
  if (type() != flexbuffers::FBT_VECTOR && !flexbuffers::IsTypedVector(type())) return std::nullopt;
  const char* elements = _target();
  const std::size_t size = loadLittle(elements - _width(), _width());
  if (type() == flexbuffers::FBT_VECTOR) return FlexList(elements, size, _width(), std::nullopt);
  // The width of each length is not kept in a vector of strings; their ends are marked as keys' are.
  const Type element = type() == flexbuffers::FBT_VECTOR_STRING_DEPRECATED
                           ? flexbuffers::FBT_KEY
                           : flexbuffers::ToTypedVectorElementType(type());
  return FlexList(elements, size, _width(), element);
}

FlexValue FlexList::operator[](std::size_t index) const {
  const char* at = _elements + index * _width;
  if (_typed) return {at, _width, flexbuffers::PackedType(flexbuffers::BIT_WIDTH_8, *_typed)};
  return {at, _width, static_cast<std::uint8_t>(_elements[_size * _width + index])};
}

FlexMap::FlexMap(const char* values, std::uint8_t width)
    : _values(values),
      _keys(values - 3 * width - loadLittle(values - 3 * width, width)),
      _size(loadLittle(values - width, width)),
      _width(width),
      _keyWidth(static_cast<std::uint8_t>(loadLittle(values - 2 * width, width))) {
  _types = values + _size * width;
}

std::string_view FlexMap::key(std::size_t index) const { return _keyAt(index); }

std::size_t FlexMap::_indexOf(std::string_view key) const {
  std::size_t first = 0;
  std::size_t end = size();
  while (first < end) {
    const std::size_t middle = first + (end - first) / 2;
    const int order = compareKey(_keyAt(middle), key);
    if (order == 0) return middle;
    if (order < 0) {
      first = middle + 1;
    } else {
      end = middle;
    }
  }
  return size();
}

FlexValue FlexMap::find(std::string_view key) const {
  const std::size_t index = _indexOf(key);
  return index < size() ? value(index) : FlexValue();
}

inline bool FlexMap::_isKey(std::size_t index, std::string_view wanted) const {
  if (index >= _size) return false;
  const char* key = _keyAt(index);
  // Keys stand before the values, as a rule: then so many bytes can be read whatever they are.
  if (_values - key <= static_cast<std::ptrdiff_t>(wanted.size())) return key == wanted;
  return key[wanted.size()] == 0 && startsWith(key, wanted);
}

FlexValue FlexMap::find(std::string_view key, Place& last) const {
  // There first: a key that stands twice is one and the same each time it is asked for.
  const bool isThere = key.size() == last.keySize && _isKey(last.index, key);
  if (!isThere) {
    const std::size_t next = last.index + 1;
    const std::size_t index = _isKey(next, key) ? next : _indexOf(key);
    if (index == size()) return {};
    last = {index, key.size()};
  }
  return value(last.index);
}

}  // namespace zal
