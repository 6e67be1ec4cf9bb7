#include "platform/linux/files/escaped_text.h"

#include <optional>

#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

void appendEscape(std::string& out, unsigned char byte) {
  constexpr std::string_view kDigits = "0123456789abcdef";
  out += "\\x";
  out += kDigits[byte >> 4U];
  out += kDigits[byte & 15U];
}

bool isControl(char32_t codePoint) { return codePoint < 0x20 || (codePoint >= 0x7f && codePoint < 0xa0); }

std::string escaped(std::string_view text, bool blanks) {
  std::string out;
  out.reserve(text.size());
  while (!text.empty()) {
    const Utf8Step step = nextUtf8(text);
    const std::string_view piece = text.substr(0, step.size);
    if (piece == "\\") {
      out += "\\\\";
    } else if (!step.valid || isControl(step.codePoint) || (blanks && piece == " ")) {
      for (const char byte : piece) appendEscape(out, static_cast<unsigned char>(byte));
    } else {
      out += piece;
    }
    text.remove_prefix(step.size);
  }
  return out;
}

std::optional<unsigned> digit(char c) {
  if (c >= '0' && c <= '9') return static_cast<unsigned>(c - '0');
  if (c >= 'a' && c <= 'f') return static_cast<unsigned>(c - 'a' + 10);
  return std::nullopt;
}

}  // namespace

std::string escapedLine(std::string_view text) { return escaped(text, false); }
std::string escapedWord(std::string_view text) { return escaped(text, true); }

std::string unescaped(std::string_view text) {
  std::string out;
  out.reserve(text.size());
  while (!text.empty()) {
    std::size_t used = 1;
    if (text.starts_with("\\\\")) {
      out += '\\';
      used = 2;
    } else if (text.starts_with("\\x") && text.size() >= 4 && digit(text[2]) && digit(text[3])) {
      out += static_cast<char>(*digit(text[2]) << 4U | *digit(text[3]));
      used = 4;
    } else {
      out += text.front();
    }
    text.remove_prefix(used);
  }
  return out;
}

std::string_view cutAtCharacter(std::string_view text, std::size_t mostBytes) {
  if (text.size() <= mostBytes) return text;
  std::size_t end = mostBytes;
  // Continuation bytes belong to the character before the cut; more than three are none's.
  for (int back = 0; back < 3 && end > 0 && (static_cast<unsigned char>(text[end]) & 0xC0U) == 0x80; ++back) {
    --end;
  }
  return text.substr(0, end);
}

}  // namespace zal
