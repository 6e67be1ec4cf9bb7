#include "platform/linux/bus/bus_value.h"

#include <concepts>
#include <string>
#include <utility>

namespace zal {
namespace {

struct Type {
  char code = 0;         ///< 0 at the end of a message or of a container
  std::string contents;  ///< of a container
};

Type nextType(const sdbus::Message& message) {
  std::string code;
  Type type;
  message.peekType(code, type.contents);
  if (!code.empty()) type.code = code.front();
  return type;
}

template <class Plain>
Value readPlain(sdbus::Message& message) {
  Plain plain{};
  message >> plain;
  if constexpr (std::same_as<Plain, bool> || std::same_as<Plain, double>) {
    return plain;
  } else if constexpr (std::unsigned_integral<Plain>) {
    return std::uint64_t{plain};
  } else if constexpr (std::signed_integral<Plain>) {
    return std::int64_t{plain};
  } else {
    return std::string(std::move(plain));
  }
}

std::string keyText(const Value& key) {
  if (const auto* const text = key.as<std::string>()) return *text;
  if (const auto* const number = key.as<std::uint64_t>()) return std::to_string(*number);
  if (const auto* const number = key.as<std::int64_t>()) return std::to_string(*number);
  return {};
}

Value readContainer(sdbus::Message& message, const Type& type);

Value readNext(sdbus::Message& message, const Type& type) {
  switch (type.code) {
    case 'b':
      return readPlain<bool>(message);
    case 'y':
      return readPlain<std::uint8_t>(message);
    case 'n':
      return readPlain<std::int16_t>(message);
    case 'q':
      return readPlain<std::uint16_t>(message);
    case 'i':
      return readPlain<std::int32_t>(message);
    case 'u':
      return readPlain<std::uint32_t>(message);
    case 'x':
      return readPlain<std::int64_t>(message);
    case 't':
      return readPlain<std::uint64_t>(message);
    case 'd':
      return readPlain<double>(message);
    case 's':
      return readPlain<std::string>(message);
    case 'o':
      return readPlain<sdbus::ObjectPath>(message);
    case 'g':
      return readPlain<sdbus::Signature>(message);
    case 'h': {
      sdbus::UnixFd closedAgain;
      message >> closedAgain;
      return {};
    }
    default:
      return readContainer(message, type);
  }
}

ValueList readRest(sdbus::Message& message) {
  ValueList values;
  for (Type type = nextType(message); type.code != 0; type = nextType(message)) {
    values.push_back(readNext(message, type));
  }
  return values;
}

ValueMap readEntries(sdbus::Message& message) {
  ValueMap entries;
  for (Type type = nextType(message); type.code != 0; type = nextType(message)) {
    message.enterDictEntry(type.contents);
    Value key = readNext(message, nextType(message));
    entries.insert_or_assign(keyText(key), readNext(message, nextType(message)));
    message.exitDictEntry();
  }
  return entries;
}

Value readContainer(sdbus::Message& message, const Type& type) {
  Value value;
  if (type.code == 'a') {
    message.enterContainer(type.contents);
    value = type.contents.starts_with('{') ? Value(readEntries(message)) : Value(readRest(message));
    message.exitContainer();
  } else if (type.code == 'r') {
    message.enterStruct(type.contents);
    value = readRest(message);
    message.exitStruct();
  } else if (type.code == 'v') {
    message.enterVariant(type.contents);
    value = readNext(message, nextType(message));
    message.exitVariant();
  }
  return value;
}

}  // namespace

ValueList readValues(sdbus::Message& message) { return readRest(message); }

}  // namespace zal
