#include "platform/linux/modemdump/message_json.h"

#include <cmath>
#include <cstdint>
#include <cstdio>
#include <vector>

namespace zal::modemdump {
namespace {

/// What the daemons on the bus can nest is bounded by the bus itself, at 64.
class Writer {
 public:
  explicit Writer(sd_bus_message* message) : _message(message) {}

  /// One value. False when the message is not as it should be.
  bool value() {
    char type = 0;
    const char* contents = nullptr;
    if (sd_bus_message_peek_type(_message, &type, &contents) <= 0) return false;
    switch (type) {
      case SD_BUS_TYPE_ARRAY:
        return contents[0] == '{' ? _object(contents) : _array(type, contents);
      case SD_BUS_TYPE_STRUCT:
        return _array(type, contents);
      case SD_BUS_TYPE_VARIANT:
        return sd_bus_message_enter_container(_message, type, contents) > 0 && value() &&
               sd_bus_message_exit_container(_message) >= 0;
      default:
        return _basic(type, false);
    }
  }
  bool isAtEnd() { return sd_bus_message_at_end(_message, 0) > 0; }
  std::string take() { return std::move(_text); }

 private:
  void _newLine() { _text += "\n" + std::string(_depth * 2, ' '); }

  bool _object(const char* contents) {
    if (sd_bus_message_enter_container(_message, SD_BUS_TYPE_ARRAY, contents) < 0) return false;
    const std::string entry(contents + 1, std::char_traits<char>::length(contents) - 2);
    _text += "{";
    ++_depth;
    bool isFirst = true;
    int result = 0;
    while ((result = sd_bus_message_enter_container(_message, SD_BUS_TYPE_DICT_ENTRY, entry.c_str())) > 0) {
      if (!isFirst) _text += ",";
      isFirst = false;
      _newLine();
      if (!_basic(entry.front(), true)) return false;
      _text += ": ";
      if (!value() || sd_bus_message_exit_container(_message) < 0) return false;
    }
    --_depth;
    if (!isFirst) _newLine();
    _text += "}";
    return result == 0 && sd_bus_message_exit_container(_message) >= 0;
  }

  bool _array(char type, const char* contents) {
    if (sd_bus_message_enter_container(_message, type, contents) < 0) return false;
    _text += "[";
    for (bool isFirst = true; !isAtEnd(); isFirst = false) {
      if (!isFirst) _text += ", ";
      if (!value()) return false;
    }
    _text += "]";
    return sd_bus_message_exit_container(_message) >= 0;
  }

  template <typename Number>
  bool _number(char type) {
    Number number{};
    if (sd_bus_message_read_basic(_message, type, &number) <= 0) return false;
    _text += std::to_string(number);
    return true;
  }

  bool _double() {
    double number = 0;
    if (sd_bus_message_read_basic(_message, SD_BUS_TYPE_DOUBLE, &number) <= 0) return false;
    char text[40];
    std::snprintf(text, sizeof text, "%.17g", number);
    _text += std::isfinite(number) ? text : "null";
    return true;
  }

  bool _truth() {
    int truth = 0;
    if (sd_bus_message_read_basic(_message, SD_BUS_TYPE_BOOLEAN, &truth) <= 0) return false;
    _text += truth != 0 ? "true" : "false";
    return true;
  }

  bool _words(char type) {
    const char* words = nullptr;
    if (sd_bus_message_read_basic(_message, type, &words) <= 0) return false;
    _text += jsonText(words);
    return true;
  }

  /// A key is in quotes whatever its type.
  bool _basic(char type, bool isKey) {
    const bool isText =
        type == SD_BUS_TYPE_STRING || type == SD_BUS_TYPE_OBJECT_PATH || type == SD_BUS_TYPE_SIGNATURE;
    if (isText) return _words(type);
    if (isKey) _text += "\"";
    const bool isRead = _bare(type);
    if (isKey) _text += "\"";
    return isRead;
  }

  bool _bare(char type) {
    switch (type) {
      case SD_BUS_TYPE_BYTE:
        return _number<std::uint8_t>(type);
      case SD_BUS_TYPE_INT16:
        return _number<std::int16_t>(type);
      case SD_BUS_TYPE_UINT16:
        return _number<std::uint16_t>(type);
      case SD_BUS_TYPE_INT32:
        return _number<std::int32_t>(type);
      case SD_BUS_TYPE_UINT32:
        return _number<std::uint32_t>(type);
      case SD_BUS_TYPE_INT64:
        return _number<std::int64_t>(type);
      case SD_BUS_TYPE_UINT64:
        return _number<std::uint64_t>(type);
      case SD_BUS_TYPE_DOUBLE:
        return _double();
      case SD_BUS_TYPE_BOOLEAN:
        return _truth();
      case SD_BUS_TYPE_UNIX_FD:
        _text += "null";
        return sd_bus_message_skip(_message, "h") >= 0;
      default:
        return false;
    }
  }

  sd_bus_message* _message;
  std::string _text;
  std::size_t _depth = 0;
};

}  // namespace

std::string jsonText(std::string_view text) {
  std::string out = "\"";
  for (const char byte : text) {
    if (byte == '"' || byte == '\\') {
      out += '\\';
      out += byte;
    } else if (static_cast<unsigned char>(byte) < 0x20) {
      char escape[8];
      std::snprintf(escape, sizeof escape, "\\u%04x", static_cast<unsigned>(byte));
      out += escape;
    } else {
      out += byte;
    }
  }
  return out + "\"";
}

std::optional<std::string> messageJson(sd_bus_message* message) {
  std::vector<std::string> values;
  Writer writer(message);
  while (!writer.isAtEnd()) {
    if (!writer.value()) return std::nullopt;
    values.push_back(writer.take());
  }
  if (values.size() == 1) return values.front() + "\n";
  std::string all = "[";
  for (std::size_t i = 0; i < values.size(); ++i) all += (i == 0 ? "" : ", ") + values[i];
  return all + "]\n";
}

}  // namespace zal::modemdump
