#include "dump/shell_word.h"

#include <algorithm>

#include "collectors/single_quoted.h"

namespace zal {
namespace {

constexpr std::string_view kPlain = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789@+._:-";

std::string wordOf(std::string_view text, std::string_view alsoPlain) {
  text = text.substr(0, text.find('\0'));
  const auto isPlain = [alsoPlain](char c) {
    return kPlain.find(c) != std::string_view::npos || alsoPlain.find(c) != std::string_view::npos;
  };
  if (!text.empty() && std::all_of(text.begin(), text.end(), isPlain)) return std::string(text);
  return singleQuoted(text);
}

}  // namespace

std::string shellWord(std::string_view text) { return wordOf(text, ""); }

std::string shellPath(std::string_view path) { return wordOf(path, "/"); }

}  // namespace zal
