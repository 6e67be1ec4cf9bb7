#include "platform/linux/bus/door/bus_dictionary.h"

#include <exception>
#include <string>
#include <string_view>
#include <utility>
#include <variant>

#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

struct BeyondLimits : std::exception {};

class DictionaryReader {
 public:
  DictionaryReader(sdbus::Message& message, const DictionaryLimits& limits)
      : _message(message), _limits(limits) {}

  ValueMap dictionary(const std::string& entry) {
    ValueMap map;
    const Nested nested(*this);
    _message.enterContainer("{" + entry + "}");
    while (_hasMore()) {
      _message.enterDictEntry(entry);
      std::string key = _text<std::string>();
      Value value = _value();
      map.emplace(std::move(key), std::move(value));
      _message.exitDictEntry();
    }
    _message.exitContainer();
    return map;
  }
  [[nodiscard]] std::size_t bytes() const { return _bytes; }

 private:
  struct Nested {
    explicit Nested(DictionaryReader& reader) : depth(reader._depth) {
      if (++depth > reader._limits.depth) throw BeyondLimits();
    }
    ~Nested() { --depth; }
    Nested(const Nested&) = delete;
    Nested& operator=(const Nested&) = delete;
    int& depth;
  };

  [[nodiscard]] std::pair<char, std::string> _next() const {
    std::string type;
    std::string contents;
    _message.peekType(type, contents);
    return {type.empty() ? '\0' : type.front(), contents};
  }
  [[nodiscard]] bool _hasMore() const { return _next().first != '\0'; }

  template <class Text>
  std::string _text() {
    Text text;
    _message >> text;
    _bytes += text.size();
    if (_bytes > _limits.bytes) throw BeyondLimits();
    return text;
  }
  template <class Plain, class Wide>
  Value _number() {
    Plain number{};
    _message >> number;
    return static_cast<Wide>(number);
  }

  Value _value() {
    const auto [type, contents] = _next();
    if (type != 'v' && ++_values > _limits.values) throw BeyondLimits();
    switch (type) {
      case 'b':
        return _number<bool, bool>();
      case 'y':
        return _number<std::uint8_t, std::uint64_t>();
      case 'q':
        return _number<std::uint16_t, std::uint64_t>();
      case 'u':
        return _number<std::uint32_t, std::uint64_t>();
      case 't':
        return _number<std::uint64_t, std::uint64_t>();
      case 'n':
        return _number<std::int16_t, std::int64_t>();
      case 'i':
        return _number<std::int32_t, std::int64_t>();
      case 'x':
        return _number<std::int64_t, std::int64_t>();
      case 'd':
        return _number<double, double>();
      case 's':
        return _text<std::string>();
      case 'o':
        return _text<sdbus::ObjectPath>();
      case 'g':
        return _text<sdbus::Signature>();
      case 'v':
        return _variant(contents);
      case 'a':
        return _array(contents);
      case 'r':
        return _struct(contents);
      default:
        return _descriptor();
    }
  }

  Value _variant(const std::string& contents) {
    const Nested nested(*this);
    _message.enterVariant(contents);
    Value value = _value();
    _message.exitVariant();
    return value;
  }

  Value _array(const std::string& contents) {
    if (contents.starts_with('{')) {
      const std::string entry = contents.substr(1, contents.size() - 2);
      return entry.starts_with('s') ? Value(dictionary(entry)) : _oddDictionary(entry);
    }
    const Nested nested(*this);
    _message.enterContainer(contents);
    ValueList list = _rest();
    _message.exitContainer();
    return list;
  }

  /// One whose keys are no texts: nothing that a request can hold, but to be got past.
  Value _oddDictionary(const std::string& entry) {
    const Nested nested(*this);
    _message.enterContainer("{" + entry + "}");
    while (_hasMore()) {
      _message.enterDictEntry(entry);
      static_cast<void>(_rest());
      _message.exitDictEntry();
    }
    _message.exitContainer();
    return {};
  }

  Value _struct(const std::string& contents) {
    const Nested nested(*this);
    _message.enterStruct(contents);
    ValueList list = _rest();
    _message.exitStruct();
    return list;
  }

  Value _descriptor() {
    sdbus::UnixFd descriptor;
    _message >> descriptor;
    return {};
  }

  ValueList _rest() {
    ValueList list;
    while (_hasMore()) list.push_back(_value());
    return list;
  }

  sdbus::Message& _message;
  const DictionaryLimits& _limits;
  std::size_t _values = 0;
  std::size_t _bytes = 0;
  int _depth = 0;
};

template <class Plain>
void writeVariant(sdbus::Message& message, const char* type, const Plain& value) {
  message.openVariant(type);
  message << value;
  message.closeVariant();
}

struct VariantWriter {
  sdbus::Message& message;
  void operator()(std::nullptr_t) const {}
  void operator()(bool value) const { writeVariant(message, "b", value); }
  void operator()(std::int64_t value) const { writeVariant(message, "x", value); }
  void operator()(std::uint64_t value) const { writeVariant(message, "t", value); }
  void operator()(double value) const { writeVariant(message, "d", value); }
  void operator()(const std::string& value) const { writeVariant(message, "s", replacedUtf8(value)); }
  void operator()(const ValueMap& map) const {
    message.openVariant("a{sv}");
    writeDictionary(message, map);
    message.closeVariant();
  }
  void operator()(const ValueList& list) const {
    message.openVariant("av");
    message.openContainer("v");
    for (const Value& value : list) std::visit(*this, value.storage);
    message.closeContainer();
    message.closeVariant();
  }
};

}  // namespace

std::optional<ReadDictionary> readDictionary(sdbus::Message& message, const DictionaryLimits& limits) {
  DictionaryReader reader(message, limits);
  try {
    ReadDictionary result;
    result.values = reader.dictionary("sv");
    result.bytes = reader.bytes();
    return result;
  } catch (const BeyondLimits&) {
    return std::nullopt;
  }
}

void writeDictionary(sdbus::Message& message, const ValueMap& values) {
  message.openContainer("{sv}");
  for (const auto& [key, value] : values) {
    if (value.as<std::nullptr_t>() != nullptr) continue;
    message.openDictEntry("sv");
    message << replacedUtf8(key);
    std::visit(VariantWriter{message}, value.storage);
    message.closeDictEntry();
  }
  message.closeContainer();
}

}  // namespace zal
