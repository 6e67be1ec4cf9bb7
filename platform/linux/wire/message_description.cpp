#include "platform/linux/wire/message_description.h"

#include <cstdio>

#include "platform/linux/wire/flex_verifier.h"
#include "platform/linux/wire/utf8.h"
#include "platform/value.h"

namespace zal {
namespace {

bool isPlain(char32_t character) {
  if (character < 0x20 || (character >= 0x7F && character <= 0x9F)) return false;
  if (character >= 0x200B && character <= 0x200F) return false;  // invisible, or direction marks
  if (character >= 0x2028 && character <= 0x202E) return false;  // line ends and direction overrides
  return !(character >= 0x2066 && character <= 0x2069) && character != 0xFEFF;
}

class Describer {
 public:
  void map(const FlexMap& map) {
    _out += '{';
    for (std::size_t i = 0; i < map.size() && _goesOn(); ++i) {
      if (i != 0) _out += ", ";
      _text(map.key(i));
      _out += ": ";
      _value(map.value(i));
    }
    _out += '}';
  }

  std::string take() {
    if (_cut) _out += " … (cut)";
    return std::move(_out);
  }

 private:
  /// Asked before each entry, so that what is open still gets its closing bracket.
  bool _goesOn() {
    if (_out.size() >= kLongestDescription) _cut = true;
    return !_cut;
  }

  void _value(const FlexValue& value) {
    if (_scalar(value)) return;
    if (const auto string = value.asString()) return _text(*string);
    if (const auto key = value.asKey()) return _text(*key);
    if (const auto inner = value.asMap()) return map(*inner);
    if (const auto list = value.asList()) return _list(*list);
    if (const auto blob = value.asBlob()) return _blob(*blob);
    _out += "null";
  }

  bool _scalar(const FlexValue& value) {
    if (const auto number = value.asInt()) {
      _out += numberText(*number);
    } else if (const auto unsignedNumber = value.asUInt()) {
      _out += numberText(*unsignedNumber) + "u";
    } else if (const auto real = value.asFloat()) {
      _out += numberText(*real);
    } else if (const auto boolean = value.asBool()) {
      _out += *boolean ? "true" : "false";
    } else {
      return false;
    }
    return true;
  }

  void _list(const FlexList& list) {
    _out += '[';
    for (std::size_t i = 0; i < list.size() && _goesOn(); ++i) {
      if (i != 0) _out += ", ";
      _value(list[i]);
    }
    _out += ']';
  }

  void _blob(std::string_view blob) {
    const auto root = verifiedFlexRoot(blob);
    _out += '<';
    if (root && root->type() == flexbuffers::FBT_NULL) {
      _out += "null";
    } else if (const auto string = root ? root->asString() : std::nullopt) {
      _text(*string);
    } else if (!root || !_scalar(*root)) {
      _out += std::to_string(blob.size()) + " bytes";
    }
    _out += '>';
  }

  void _text(std::string_view text) {
    const std::size_t whole = text.size();
    const std::size_t end = _out.size() + kLongestDescribedText;
    _out += '"';
    while (!text.empty() && _out.size() < end) {
      const Utf8Step step = nextUtf8(text);
      _character(step, text.substr(0, step.size));
      text.remove_prefix(step.size);
    }
    _out += '"';
    if (!text.empty()) _out += "… (" + std::to_string(whole) + " bytes)";
  }

  void _character(const Utf8Step& step, std::string_view bytes) {
    char escaped[16];
    if (!step.valid) {
      for (const char byte : bytes) {
        std::snprintf(escaped, sizeof escaped, "\\x%02X",
                      static_cast<unsigned>(static_cast<unsigned char>(byte)));
        _out += escaped;
      }
    } else if (step.codePoint == '\n') {
      _out += "\\n";
    } else if (step.codePoint == '\t') {
      _out += "\\t";
    } else if (step.codePoint == '"' || step.codePoint == '\\') {
      _out += '\\';
      _out += bytes;
    } else if (isPlain(step.codePoint)) {
      _out += bytes;
    } else {
      std::snprintf(escaped, sizeof escaped, "\\u{%X}", static_cast<unsigned>(step.codePoint));
      _out += escaped;
    }
  }

  std::string _out;
  bool _cut = false;
};

}  // namespace

std::string messageDescription(const FlexMap& map) {
  Describer describer;
  describer.map(map);
  return describer.take();
}

}  // namespace zal
