#include "platform/utf8_walk.h"

namespace zal {

LeadingCharacter leadingCharacter(std::string_view text) {
  const auto byte = [&](std::size_t at) { return static_cast<unsigned char>(text[at]); };
  const unsigned first = byte(0);
  if (first < 0x80) return {first, 1, true};
  const std::size_t length = first >= 0xF0 ? 4 : first >= 0xE0 ? 3 : 2;
  const LeadingCharacter broken{first, 1, false};
  if (first < 0xC2 || first > 0xF4 || text.size() < length) return broken;
  char32_t code = first & (0x7FU >> length);
  for (std::size_t i = 1; i < length; ++i) {
    if ((byte(i) & 0xC0U) != 0x80U) return broken;
    code = code << 6U | (byte(i) & 0x3FU);
  }
  constexpr char32_t kSmallest[] = {0, 0, 0x80, 0x800, 0x10000};
  const bool surrogate = code >= 0xD800 && code <= 0xDFFF;
  if (code < kSmallest[length] || code > 0x10FFFF || surrogate) return broken;
  return {code, length, true};
}

bool isHarmless(char32_t code) {
  if (code < 0x20 || (code >= 0x7F && code <= 0x9F)) return false;
  if (code >= 0x200B && code <= 0x200F) return false;
  if (code >= 0x2028 && code <= 0x202E) return false;
  return !(code >= 0x2066 && code <= 0x2069) && code != 0xFEFF;
}

}  // namespace zal
