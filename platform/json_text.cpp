#include "platform/json_text.h"

#include <cstdio>

#include "platform/utf8_walk.h"

namespace zal {
namespace {

std::string escaped(char32_t code) {
  if (code == '"') return "\\\"";
  if (code == '\\') return "\\\\";
  if (code == '\n') return "\\n";
  if (code == '\t') return "\\t";
  char text[16];
  std::snprintf(text, sizeof text, "\\u%04x", static_cast<unsigned>(code));
  return text;
}

}  // namespace

std::string jsonString(std::string_view text) {
  std::string out = "\"";
  while (!text.empty()) {
    const LeadingCharacter character = leadingCharacter(text);
    if (!character.valid) {
      out += "\\ufffd";
    } else if (character.code == '"' || character.code == '\\' || !isHarmless(character.code)) {
      out += escaped(character.code);
    } else {
      out.append(text.substr(0, character.length));
    }
    text.remove_prefix(character.length);
  }
  return out + "\"";
}

std::string jsonArray(const std::vector<std::string>& elements) {
  std::string out = "[";
  for (const std::string& element : elements) {
    if (out.size() > 1) out += ", ";
    out += element;
  }
  return out + "]";
}

JsonObject& JsonObject::addJson(std::string_view key, std::string_view json) {
  if (!_members.empty()) _members += ", ";
  _members += jsonString(key) + ": ";
  _members += json;
  return *this;
}

}  // namespace zal
