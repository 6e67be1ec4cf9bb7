#include "platform/linux/wire/flex_value.h"

#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

using flexbuffers::Type;

std::int64_t loadSigned(const char* from, std::size_t width) {
  const auto unused = 64U - 8U * static_cast<unsigned>(width);
  return static_cast<std::int64_t>(loadLittle(from, width) << unused) >> unused;
}

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

bool isKey(const char* key, std::string_view wanted) {
  for (const char character : wanted) {
    if (*key != character || character == 0) return false;
    ++key;
  }
  return *key == 0;
}

}  // namespace

const char* FlexValue::_target() const { return _at - loadLittle(_at, _parentWidth); }

std::string_view FlexValue::_counted() const {
  const char* start = _target();
  return {start, loadLittle(start - _width, _width)};
}

std::optional<std::int64_t> FlexValue::asInt() const {
  if (_type == flexbuffers::FBT_INT) return loadSigned(_at, _parentWidth);
  if (_type == flexbuffers::FBT_INDIRECT_INT) return loadSigned(_target(), _width);
  return std::nullopt;
}

std::optional<std::uint64_t> FlexValue::asUInt() const {
  if (_type == flexbuffers::FBT_UINT) return loadLittle(_at, _parentWidth);
  if (_type == flexbuffers::FBT_INDIRECT_UINT) return loadLittle(_target(), _width);
  return std::nullopt;
}

std::optional<double> FlexValue::asFloat() const {
  if (_type == flexbuffers::FBT_FLOAT) return loadFloat(_at, _parentWidth);
  if (_type == flexbuffers::FBT_INDIRECT_FLOAT) return loadFloat(_target(), _width);
  return std::nullopt;
}

std::optional<bool> FlexValue::asBool() const {
  if (_type != flexbuffers::FBT_BOOL) return std::nullopt;
  return loadLittle(_at, _parentWidth) != 0;
}

std::optional<std::string_view> FlexValue::asString() const {
  if (_type != flexbuffers::FBT_STRING) return std::nullopt;
  return _counted();
}

std::optional<std::string_view> FlexValue::asBlob() const {
  if (_type != flexbuffers::FBT_BLOB) return std::nullopt;
  return _counted();
}

std::optional<std::string_view> FlexValue::asKey() const {
  if (_type != flexbuffers::FBT_KEY) return std::nullopt;
  return std::string_view(_target());
}

std::optional<FlexMap> FlexValue::asMap() const {
  if (_type != flexbuffers::FBT_MAP) return std::nullopt;
  return FlexMap(_target(), _width);
}

std::optional<FlexList> FlexValue::asList() const {
  if (flexbuffers::IsFixedTypedVector(_type)) {
    std::uint8_t size = 0;
    const Type element = flexbuffers::ToFixedTypedVectorElementType(_type, &size);
    return FlexList(_target(), size, _width, element);
  }
  if (_type != flexbuffers::FBT_VECTOR && !flexbuffers::IsTypedVector(_type)) return std::nullopt;
  const char* elements = _target();
  const std::size_t size = loadLittle(elements - _width, _width);
  if (_type == flexbuffers::FBT_VECTOR) return FlexList(elements, size, _width, std::nullopt);
  // The width of each length is not kept in a vector of strings; their ends are marked as keys' are.
  const Type element = _type == flexbuffers::FBT_VECTOR_STRING_DEPRECATED
                           ? flexbuffers::FBT_KEY
                           : flexbuffers::ToTypedVectorElementType(_type);
  return FlexList(elements, size, _width, element);
}

FlexValue FlexList::operator[](std::size_t index) const {
  const char* at = _elements + index * _width;
  if (_typed) return {at, _width, flexbuffers::PackedType(flexbuffers::BIT_WIDTH_8, *_typed)};
  return {at, _width, static_cast<std::uint8_t>(_elements[_size * _width + index])};
}

FlexMap::FlexMap(const char* values, std::uint8_t width)
    : _values(values, loadLittle(values - width, width), width, std::nullopt),
      _keys(values - 3 * width - loadLittle(values - 3 * width, width)),
      _keyWidth(static_cast<std::uint8_t>(loadLittle(values - 2 * width, width))) {}

const char* FlexMap::_keyAt(std::size_t index) const {
  const char* at = _keys + index * _keyWidth;
  return at - loadLittle(at, _keyWidth);
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
  return index < size() ? _values[index] : FlexValue();
}

FlexValue FlexMap::find(std::string_view key, std::size_t& at) const {
  std::size_t index = at;
  // Where it was last first: a key that stands twice is one and the same each time it is asked for.
  if (index >= size() || !isKey(_keyAt(index), key)) ++index;
  if (index >= size() || !isKey(_keyAt(index), key)) index = _indexOf(key);
  if (index == size()) return {};
  at = index;
  return _values[index];
}

}  // namespace zal
