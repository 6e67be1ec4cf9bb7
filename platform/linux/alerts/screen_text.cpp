#include "platform/linux/alerts/screen_text.h"

#include <utility>
#include <vector>

#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

constexpr std::string_view kEllipsis = "\xE2\x80\xA6";

/// Also those that turn the direction of what follows: a name could read as another.
bool isControl(char32_t c) {
  return c < 0x20 || (c >= 0x7f && c < 0xa0) || (c >= 0x202a && c <= 0x202e) || (c >= 0x2066 && c <= 0x2069);
}

std::string harmless(std::string_view text, std::size_t mostCharacters, bool keepsLines) {
  std::string result;
  for (std::size_t count = 0; !text.empty(); ++count) {
    if (count == mostCharacters) return result.append(kEllipsis);
    const Utf8Step step = nextUtf8(text);
    const bool isKept = step.valid && (!isControl(step.codePoint) || (keepsLines && step.codePoint == '\n'));
    result.append(isKept ? text.substr(0, step.size) : " ");
    text.remove_prefix(step.size);
  }
  return result;
}

/// One line's characters, folded.
void fold(std::string_view line, std::size_t width, std::vector<std::string>& lines) {
  std::string current;
  std::size_t count = 0;
  std::size_t afterBlank = 0;  // bytes of `current` up to its last blank
  while (!line.empty()) {
    if (count == width) {
      const std::size_t cut = afterBlank != 0 ? afterBlank : current.size();
      std::string rest = current.substr(cut);
      current.resize(cut);
      while (current.ends_with(' ')) current.pop_back();
      lines.push_back(std::exchange(current, std::move(rest)));
      count = 0;
      for (std::string_view left = current; !left.empty(); left.remove_prefix(nextUtf8(left).size)) ++count;
      afterBlank = 0;
    }
    const std::size_t size = nextUtf8(line).size;
    current.append(line.substr(0, size));
    if (line.front() == ' ') afterBlank = current.size();
    line.remove_prefix(size);
    ++count;
  }
  lines.push_back(std::move(current));
}

}  // namespace

std::string screenLine(std::string_view text, std::size_t mostCharacters) {
  return harmless(text, mostCharacters, false);
}

std::string screenText(std::string_view text, std::size_t mostCharacters) {
  return harmless(text, mostCharacters, true);
}

std::string foldedText(std::string_view text, std::size_t width, std::size_t mostLines) {
  std::vector<std::string> lines;
  while (true) {
    const std::size_t end = text.find('\n');
    fold(text.substr(0, end), width, lines);
    if (end == std::string_view::npos) break;
    text.remove_prefix(end + 1);
  }
  std::string result;
  for (std::size_t i = 0; i < lines.size(); ++i) {
    if (i == mostLines) return result.append(kEllipsis);
    if (i != 0) result += '\n';
    result += lines[i];
  }
  return result;
}

}  // namespace zal
