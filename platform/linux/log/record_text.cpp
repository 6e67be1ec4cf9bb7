#include "platform/linux/log/record_text.h"

#include <array>
#include <bit>
#include <cstdint>
#include <cstdlib>
#include <cstring>

#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

constexpr std::uint64_t kOnes = 0x0101010101010101U;
constexpr std::uint64_t kTops = 0x8080808080808080U;

/// Top bit of each byte that is zero; bytes above a zero one may be marked too, never below it.
constexpr std::uint64_t zeroBytes(std::uint64_t word) { return (word - kOnes) & ~word & kTops; }
constexpr std::uint64_t bytesBelow0x20(std::uint64_t word) { return (word - kOnes * 0x20) & ~word & kTops; }
/// Top bits are set where a byte is not one from 0x20 to 0x7e; below the first such byte nothing carries
/// over.
constexpr std::uint64_t notPrintable(std::uint64_t word) {
  return word | (word - kOnes * 0x20) | (word + kOnes);
}

bool isSpecial(unsigned char c) { return c < 0x20 || c == 0x7f || c == 0xC2; }

/// How many bytes at the start need no second look: neither a control character nor the lead byte
/// that the control characters from U+0080 to U+009F begin with. Many at a time, since nearly all
/// of what is logged passes here.
std::size_t plainLength(const char* text, std::size_t length) {
  const auto unprintable = [text](std::size_t at) { return notPrintable(loadLittle(text + at, 8)); };
  std::size_t at = 0;
  for (; at + 32 <= length; at += 32) {
    const auto found = unprintable(at) | unprintable(at + 8) | unprintable(at + 16) | unprintable(at + 24);
    if ((found & kTops) != 0) break;
  }
  for (; at + 8 <= length; at += 8) {
    const std::uint64_t word = loadLittle(text + at, 8);
    if ((notPrintable(word) & kTops) == 0) continue;
    const std::uint64_t found =
        bytesBelow0x20(word) | zeroBytes(word ^ (kOnes * 0x7f)) | zeroBytes(word ^ (kOnes * 0xC2));
    if (found != 0) return at + static_cast<std::size_t>(std::countr_zero(found)) / 8;
  }
  // The last eight once more, in place of single bytes.
  if (length >= 8 && (unprintable(length - 8) & kTops) == 0) return length;
  while (at < length && !isSpecial(static_cast<unsigned char>(text[at]))) ++at;
  return at;
}

void appendEscaped(std::string& target, unsigned char c) {
  constexpr std::string_view kDigits = "0123456789abcdef";
  const std::array<char, 4> escaped{'\\', 'x', kDigits[c >> 4U], kDigits[c & 15U]};
  target.append(escaped.data(), escaped.size());
}

constexpr auto kDigitPairs = [] {
  std::array<char, 200> pairs{};
  for (std::size_t i = 0; i < 100; ++i) {
    pairs[2 * i] = static_cast<char>('0' + i / 10);
    pairs[2 * i + 1] = static_cast<char>('0' + i % 10);
  }
  return pairs;
}();

char* putBefore(char* end, std::string_view text) {
  text.copy(end - text.size(), text.size());
  return end - text.size();
}

/// Returned, as above: where it begins.
char* putNumberBefore(char* end, std::uint64_t number) {
  for (; number >= 100; number /= 100) std::memcpy(end -= 2, &kDigitPairs[2 * (number % 100)], 2);
  if (number >= 10) {
    std::memcpy(end -= 2, &kDigitPairs[2 * number], 2);
  } else {
    *--end = static_cast<char>('0' + number);
  }
  return end;
}

}  // namespace

void appendMarkedText(std::string& target, std::string_view text, std::string_view linePrefix) {
  for (;;) {
    const std::size_t plain = plainLength(text.data(), text.size());
    target.append(text.data(), plain);
    if (plain == text.size()) return;
    const auto special = static_cast<unsigned char>(text[plain]);
    text.remove_prefix(plain + 1);
    if (special == '\n') {
      target += '\n';
      target.append(linePrefix).append(kContinuationMark);
    } else if (special == '\t') {
      target += '\t';
    } else if (special != 0xC2) {
      appendEscaped(target, special);
    } else if (!text.empty() && static_cast<unsigned char>(text.front()) < 0xA0 &&
               static_cast<unsigned char>(text.front()) >= 0x80) {
      appendEscaped(target, static_cast<unsigned char>(text.front()));
      text.remove_prefix(1);
    } else {
      target += static_cast<char>(special);
    }
  }
}

void appendOneLine(std::string& target, std::string_view text) {
  for (;;) {
    const std::size_t lineEnd = text.find('\n');
    appendMarkedText(target, text.substr(0, lineEnd));
    if (lineEnd == std::string_view::npos) return;
    appendEscaped(target, '\n');
    text.remove_prefix(lineEnd + 1);
  }
}

void appendRecord(std::string& target, const LogRecord& record, std::string_view timeText,
                  std::string_view processText) {
  // Put together aside, from its end, since each append has its price.
  std::array<char, 64> numbers;
  char* const end = numbers.data() + numbers.size();
  char* at = putBefore(end, " ");
  if (record.time != 0) at = putBefore(putNumberBefore(at, record.time), " t=");
  const auto level = static_cast<std::int64_t>(record.level);
  at = putNumberBefore(putBefore(at, ">"), static_cast<std::uint64_t>(std::abs(level)));
  at = putBefore(at, level < 0 ? " <-" : " <");
  target.append(timeText).append(at, static_cast<std::size_t>(end - at));
  if (record.processInformation) target.append(processText) += ' ';
  appendMarkedText(target, record.line);
  target += '\n';
}

std::size_t nextRecordStart(std::string_view text, std::size_t offset) {
  for (;;) {
    const std::size_t lineEnd = text.find('\n', offset);
    if (lineEnd == std::string_view::npos) return text.size();
    offset = lineEnd + 1;
    if (!text.substr(offset).starts_with(kContinuationMark)) return offset;
  }
}

std::size_t countRecords(std::string_view text) {
  std::size_t count = 0;
  for (std::size_t at = 0; at < text.size(); at = nextRecordStart(text, at)) ++count;
  return count;
}

}  // namespace zal
