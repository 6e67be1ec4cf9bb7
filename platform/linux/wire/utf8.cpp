#include "platform/linux/wire/utf8.h"

#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

constexpr std::uint64_t kTops = 0x8080808080808080U;

/// Bytes of plain ASCII at the beginning, counted in eights where possible.
std::size_t asciiPrefix(std::string_view text) {
  std::size_t at = 0;
  while (text.size() - at >= 8 && (loadLittle(text.data() + at, 8) & kTops) == 0) at += 8;
  while (at < text.size() && static_cast<unsigned char>(text[at]) < 0x80) ++at;
  return at;
}

/// Nearly every text that is asked about: this much faster than by its prefix.
bool isAscii(std::string_view text) {
  const char* at = text.data();
  const char* const end = at + text.size();
  for (; end - at >= 32; at += 32) {
    const auto seen =
        loadLittle(at, 8) | loadLittle(at + 8, 8) | loadLittle(at + 16, 8) | loadLittle(at + 24, 8);
    if ((seen & kTops) != 0) return false;
  }
  // The last ones overlap others, in place of single bytes.
  std::uint64_t seen = 0;
  if (text.size() >= 8) {
    for (; end - at > 8; at += 8) seen |= loadLittle(at, 8);
    seen |= loadLittle(end - 8, 8);
  } else if (text.size() >= 4) {
    seen = loadLittle(at, 4) | loadLittle(end - 4, 4);
  } else {
    for (; at != end; ++at) seen |= static_cast<unsigned char>(*at);
  }
  return (seen & kTops) == 0;
}

struct Lead {
  std::size_t size;       // of the whole character; 0: no character begins so
  unsigned char lowest;   // of the second byte
  unsigned char highest;  // of the second byte
};

Lead leadOf(unsigned char byte) {
  if (byte >= 0xC2 && byte <= 0xDF) return {2, 0x80, 0xBF};
  if (byte == 0xE0) return {3, 0xA0, 0xBF};  // below: overlong
  if (byte == 0xED) return {3, 0x80, 0x9F};  // above: surrogates
  if (byte >= 0xE1 && byte <= 0xEF) return {3, 0x80, 0xBF};
  if (byte == 0xF0) return {4, 0x90, 0xBF};  // below: overlong
  if (byte >= 0xF1 && byte <= 0xF3) return {4, 0x80, 0xBF};
  if (byte == 0xF4) return {4, 0x80, 0x8F};  // above: past U+10FFFF
  return {0, 0, 0};
}

}  // namespace

Utf8Step nextUtf8(std::string_view text) {
  const auto first = static_cast<unsigned char>(text.front());
  if (first < 0x80) return {first, 1, true};
  const Lead lead = leadOf(first);
  if (lead.size == 0) return {0xFFFD, 1, false};
  char32_t codePoint = first & (0x7FU >> lead.size);
  for (std::size_t i = 1; i < lead.size; ++i) {
    if (i == text.size()) return {0xFFFD, i, false};
    const auto byte = static_cast<unsigned char>(text[i]);
    const bool fits = i == 1 ? byte >= lead.lowest && byte <= lead.highest : (byte & 0xC0U) == 0x80;
    if (!fits) return {0xFFFD, i, false};
    codePoint = codePoint << 6U | (byte & 0x3FU);
  }
  return {codePoint, lead.size, true};
}

bool isUtf8(std::string_view text) {
  if (isAscii(text)) return true;
  for (text.remove_prefix(asciiPrefix(text)); !text.empty(); text.remove_prefix(asciiPrefix(text))) {
    const Utf8Step step = nextUtf8(text);
    if (!step.valid) return false;
    text.remove_prefix(step.size);
  }
  return true;
}

std::string replacedUtf8(std::string_view text) {
  std::string out;
  out.reserve(text.size() + text.size() / 8);
  while (!text.empty()) {
    const std::size_t ascii = asciiPrefix(text);
    out.append(text.substr(0, ascii));
    text.remove_prefix(ascii);
    if (text.empty()) break;
    const Utf8Step step = nextUtf8(text);
    out.append(step.valid ? text.substr(0, step.size) : std::string_view("\xEF\xBF\xBD"));
    text.remove_prefix(step.size);
  }
  return out;
}

}  // namespace zal
