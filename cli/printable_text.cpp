#include "cli/printable_text.h"

#include <cstdio>

#include "platform/utf8_walk.h"

namespace zal {
namespace {

std::string escaped(const LeadingCharacter& character) {
  if (character.valid && character.code == '\n') return "\\n";
  if (character.valid && character.code == '\t') return "\\t";
  if (character.valid && character.code == '\r') return "\\r";
  char text[16];
  const char* const format = character.valid && character.code > 0xFF ? "\\u%04x" : "\\x%02x";
  std::snprintf(text, sizeof text, format, static_cast<unsigned>(character.code));
  return text;
}

std::string printable(std::string_view text, bool keepsLines) {
  std::string out;
  out.reserve(text.size());
  while (!text.empty()) {
    const LeadingCharacter character = leadingCharacter(text);
    const bool kept = keepsLines && (character.code == '\n' || character.code == '\t');
    if (character.valid && (kept || isHarmless(character.code))) {
      out.append(text.substr(0, character.length));
    } else {
      out += escaped(character);
    }
    text.remove_prefix(character.length);
  }
  return out;
}

}  // namespace

std::string printableLine(std::string_view text) { return printable(text, false); }
std::string printableLines(std::string_view text) { return printable(text, true); }

}  // namespace zal
