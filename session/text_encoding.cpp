#include "session/text_encoding.h"

#include <array>
#include <cstdint>
#include <cstring>

namespace zal {

namespace {

constexpr std::uint64_t kHighBits = 0x8080808080808080U;

std::uint64_t wordAt(const char* bytes) {
  std::uint64_t word = 0;
  std::memcpy(&word, bytes, sizeof word);
  return word;
}

std::size_t asciiPrefix(std::string_view text) {
  constexpr std::size_t kWord = sizeof(std::uint64_t);
  const char* const bytes = text.data();
  std::size_t at = 0;
  for (; at + 4 * kWord <= text.size(); at += 4 * kWord) {
    const std::uint64_t together = wordAt(bytes + at) | wordAt(bytes + at + kWord) |
                                   wordAt(bytes + at + 2 * kWord) | wordAt(bytes + at + 3 * kWord);
    if ((together & kHighBits) != 0) break;
  }
  while (at < text.size() && static_cast<unsigned char>(text[at]) < 0x80) ++at;
  return at;
}

bool isContinuation(unsigned char byte) { return (byte & 0xC0U) == 0x80U; }

// Bytes of the sequence that begins the text, 0 when none that is well-formed does.
std::size_t sequenceLength(std::string_view text) {
  const auto byte = [&](std::size_t at) { return static_cast<unsigned char>(text[at]); };
  const unsigned char lead = byte(0);
  if (lead < 0x80) return 1;
  const std::size_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
  if (lead < 0xC2 || lead > 0xF4 || text.size() < length) return 0;
  for (std::size_t at = 1; at < length; ++at) {
    if (!isContinuation(byte(at))) return 0;
  }
  const bool overlong = (lead == 0xE0 && byte(1) < 0xA0) || (lead == 0xF0 && byte(1) < 0x90);
  const bool surrogate = lead == 0xED && byte(1) > 0x9F;
  const bool tooLarge = lead == 0xF4 && byte(1) > 0x8F;
  return overlong || surrogate || tooLarge ? 0 : length;
}

// NEL, no-break space, the spaces of the General Punctuation block, line and paragraph separator, and
// the three lone ones: what counts as white beyond ASCII.
constexpr std::array<std::string_view, 19> kWideWhite = {
    "\u0085", "\u00A0", "\u1680", "\u2000", "\u2001", "\u2002", "\u2003", "\u2004", "\u2005", "\u2006",
    "\u2007", "\u2008", "\u2009", "\u200A", "\u2028", "\u2029", "\u202F", "\u205F", "\u3000"};
constexpr std::string_view kWhite = " \t\n\v\f\r";

}  // namespace

bool isAscii(std::string_view text) { return asciiPrefix(text) == text.size(); }

std::size_t utf16Length(std::string_view text) {
  std::size_t units = asciiPrefix(text);
  if (units == text.size()) return units;
  for (const char character : text.substr(units)) {
    const auto byte = static_cast<unsigned char>(character);
    if (!isContinuation(byte)) units += byte >= 0xF0 ? 2 : 1;
  }
  return units;
}

std::string_view utf16Prefix(std::string_view text, std::size_t units) {
  std::size_t at = 0;
  while (at < text.size()) {
    const auto lead = static_cast<unsigned char>(text[at]);
    const std::size_t cost = lead >= 0xF0 ? 2 : 1;
    if (cost > units) break;
    units -= cost;
    do {
      ++at;
    } while (at < text.size() && isContinuation(static_cast<unsigned char>(text[at])));
  }
  return text.substr(0, at);
}

bool isValidUtf8(std::string_view text) {
  for (;;) {
    text.remove_prefix(asciiPrefix(text));
    if (text.empty()) return true;
    const std::size_t length = sequenceLength(text);
    if (length == 0) return false;
    text.remove_prefix(length);
  }
}

std::string_view trimmed(std::string_view text) {
  for (bool changed = true; changed && !text.empty();) {
    changed = false;
    if (kWhite.find(text.front()) != std::string_view::npos) {
      text.remove_prefix(1);
      changed = true;
      continue;
    }
    if (kWhite.find(text.back()) != std::string_view::npos) {
      text.remove_suffix(1);
      changed = true;
      continue;
    }
    for (const std::string_view white : kWideWhite) {
      if (text.starts_with(white)) {
        text.remove_prefix(white.size());
        changed = true;
      } else if (text.ends_with(white)) {
        text.remove_suffix(white.size());
        changed = true;
      }
    }
  }
  return text;
}

}  // namespace zal
