#include "platform/linux/wire/flex_verifier.h"

#include <type_traits>

#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

using flexbuffers::Type;

bool isWidth(std::uint64_t width) { return width == 1 || width == 2 || width == 4 || width == 8; }

/// Calls with the width as a constant, so that what loops over slots of it loads them in one go.
template <class Call>
bool withConstantWidth(std::size_t width, const Call& call) {
  switch (width) {
    case 1:
      return call(std::integral_constant<std::size_t, 1>());
    case 2:
      return call(std::integral_constant<std::size_t, 2>());
    case 4:
      return call(std::integral_constant<std::size_t, 4>());
    default:
      return call(std::integral_constant<std::size_t, 8>());
  }
}

class Verifier {
 public:
  explicit Verifier(std::string_view buffer)
      : _bytes(buffer.data()),
        _size(buffer.size()),
        _lastZero(buffer.rfind('\0')),
        _visitsLeft(buffer.size()) {}

  bool root(std::size_t at, std::size_t width, std::uint8_t packed) {
    return _visit(1) && _value(at, width, packed, 0);
  }

 private:
  /// Offsets may lead many times to the same place: what is looked at is bounded by the buffer's size.
  bool _visit(std::uint64_t values) {
    if (values > _visitsLeft) return false;
    _visitsLeft -= values;
    return true;
  }

  /// The value, visited already, whose slot of `parentWidth` bytes (inside the buffer) stands at `at`.
  bool _value(std::size_t at, std::size_t parentWidth, std::uint8_t packed, int depth) {
    const std::size_t width = std::size_t{1} << (packed & 3U);
    const auto type = static_cast<Type>(packed >> 2U);
    if (type == flexbuffers::FBT_FLOAT) return parentWidth >= 4;
    if (flexbuffers::IsInline(type)) return true;
    std::size_t start = 0;
    if (!_follow(at, parentWidth, start)) return false;
    switch (type) {
      case flexbuffers::FBT_KEY:
        return _keyEnds(start);
      case flexbuffers::FBT_STRING:
        return _counted(start, width, 1, 1);  // of a root; elements took the short way
      case flexbuffers::FBT_BLOB:
        return _counted(start, width, 1, 0);
      case flexbuffers::FBT_INDIRECT_FLOAT:
        return width >= 4 && _fits(start, 1, width);
      case flexbuffers::FBT_INDIRECT_INT:
      case flexbuffers::FBT_INDIRECT_UINT:
        return _fits(start, 1, width);
      case flexbuffers::FBT_MAP:
        return _keysOfMap(start, width) && _elements(start, width, depth);
      case flexbuffers::FBT_VECTOR:
        return _elements(start, width, depth);
      default:
        return _typed(type, start, width);
    }
  }

  [[nodiscard]] std::uint64_t _load(std::size_t at, std::size_t width) const {
    return loadLittle(_bytes + at, width);
  }
  [[nodiscard]] bool _fits(std::size_t start, std::uint64_t count, std::size_t each) const {
    return start <= _size && count <= (_size - start) / each;
  }
  /// Offsets count back from their own place; only something empty can begin right there, and what
  /// points at itself runs into the depth limit.
  bool _follow(std::size_t at, std::size_t width, std::size_t& target) const {
    const std::uint64_t offset = _load(at, width);
    if (offset > at) return false;
    target = at - offset;
    return true;
  }
  /// One zero byte at or after its start ends a key.
  [[nodiscard]] bool _keyEnds(std::size_t start) const {
    return _lastZero != std::string_view::npos && start <= _lastZero;
  }
  /// What its length says, each that large, and `extra` bytes more, lie inside.
  [[nodiscard]] bool _counted(std::size_t start, std::size_t width, std::size_t each,
                              std::size_t extra) const {
    if (start < width) return false;
    return _size - start >= extra && _load(start - width, width) <= (_size - start - extra) / each;
  }

  bool _elements(std::size_t start, std::size_t width, int depth) {
    return withConstantWidth(width, [=, this](auto constant) { return _elementsOf(start, constant, depth); });
  }

  template <class Width>
  bool _elementsOf(std::size_t start, Width width, int depth) {
    if (depth >= kMaximumFlexDepth || !_counted(start, width, width + 1, 0)) return false;
    const std::uint64_t count = _load(start - width, width);
    if (!_visit(count)) return false;
    const std::size_t types = start + count * width;
    for (std::uint64_t i = 0; i < count; ++i) {
      const auto packed = static_cast<std::uint8_t>(_bytes[types + i]);
      const std::size_t at = start + i * width;
      // Nearly all that is ever sent are texts and numbers: these without a call.
      switch (packed >> 2U) {
        case flexbuffers::FBT_INT:
        case flexbuffers::FBT_UINT:
          break;
        case flexbuffers::FBT_STRING:
          if (!_string(at, width, packed)) return false;
          break;
        default:
          if (!_value(at, width, packed, depth + 1)) return false;
      }
    }
    return true;
  }

  bool _string(std::size_t at, std::size_t parentWidth, std::uint8_t packed) {
    std::size_t start = 0;
    return _follow(at, parentWidth, start) && _counted(start, std::size_t{1} << (packed & 3U), 1, 1);
  }

  bool _keysOfMap(std::size_t start, std::size_t width) {
    if (start < 3 * width) return false;
    const std::uint64_t keyWidth = _load(start - 2 * width, width);
    std::size_t keys = 0;
    if (!isWidth(keyWidth) || !_follow(start - 3 * width, width, keys)) return false;
    if (keys < keyWidth || _load(keys - keyWidth, keyWidth) != _load(start - width, width)) return false;
    return _keyTable(keys, keyWidth);
  }

  bool _keyTable(std::size_t start, std::size_t width) {
    return withConstantWidth(width, [=, this](auto constant) { return _keyTableOf(start, constant); });
  }

  template <class Width>
  bool _keyTableOf(std::size_t start, Width width) {
    if (!_counted(start, width, width, 0)) return false;
    const std::uint64_t count = _load(start - width, width);
    if (!_visit(count)) return false;
    for (std::uint64_t i = 0; i < count; ++i) {
      std::size_t key = 0;
      if (!_follow(start + i * width, width, key) || !_keyEnds(key)) return false;
    }
    return true;
  }

  bool _typed(Type type, std::size_t start, std::size_t width) {
    if (flexbuffers::IsFixedTypedVector(type)) {
      std::uint8_t count = 0;
      const Type element = flexbuffers::ToFixedTypedVectorElementType(type, &count);
      return (element != flexbuffers::FBT_FLOAT || width >= 4) && _fits(start, count, width);
    }
    switch (type) {
      case flexbuffers::FBT_VECTOR_FLOAT:
        return width >= 4 && _counted(start, width, width, 0);
      case flexbuffers::FBT_VECTOR_INT:
      case flexbuffers::FBT_VECTOR_UINT:
      case flexbuffers::FBT_VECTOR_BOOL:
        return _counted(start, width, width, 0);
      case flexbuffers::FBT_VECTOR_KEY:
      case flexbuffers::FBT_VECTOR_STRING_DEPRECATED:
        return _keyTable(start, width);
      default:
        return false;
    }
  }

  const char* _bytes;
  std::size_t _size;
  std::size_t _lastZero;
  std::size_t _visitsLeft;
};

}  // namespace

std::optional<FlexValue> verifiedFlexRoot(std::string_view buffer) {
  if (buffer.size() < 3) return std::nullopt;
  const auto width = static_cast<std::uint8_t>(buffer.back());
  const auto packed = static_cast<std::uint8_t>(buffer[buffer.size() - 2]);
  if (!isWidth(width) || buffer.size() < 2U + width) return std::nullopt;
  const std::size_t at = buffer.size() - 2 - width;
  if (!Verifier(buffer).root(at, width, packed)) return std::nullopt;
  return FlexValue(buffer.data() + at, width, packed);
}

}  // namespace zal
