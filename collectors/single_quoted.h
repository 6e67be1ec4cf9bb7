#pragma once

#include <string>
#include <string_view>

namespace zal {

/// The text as one word of a shell's line, whatever it holds but a NUL. Any thread.
[[nodiscard]] inline std::string singleQuoted(std::string_view text) {
  std::string word = "'";
  for (const char c : text) {
    // Nothing can stand for a quote inside quotes: they are closed, one follows, they are opened.
    if (c == '\'') {
      word += "'\\''";
    } else {
      word += c;
    }
  }
  return word + "'";
}

}  // namespace zal
