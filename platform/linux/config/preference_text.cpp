#include "platform/linux/config/preference_text.h"

#include <algorithm>

#include <toml++/toml.h>

#include "platform/linux/config/toml_error.h"

namespace zal {
namespace {

bool isBareKey(std::string_view key) {
  return !key.empty() && std::all_of(key.begin(), key.end(), [](char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_' || c == '-';
  });
}

/// Where a line and column of the parser are in the text; columns count code points from 1.
std::size_t offsetOf(std::string_view text, const toml::source_position& position) {
  std::size_t offset = 0;
  for (toml::source_index line = 1; line < position.line; ++line) offset = text.find('\n', offset) + 1;
  for (toml::source_index column = 1; column < position.column && offset < text.size(); ++column) {
    do {
      ++offset;
    } while (offset < text.size() && (static_cast<unsigned char>(text[offset]) & 0xC0U) == 0x80U);
  }
  return offset;
}

std::string withNewKey(const std::string& text, const toml::table& document, const std::string& line) {
  const bool hasSections = std::any_of(document.begin(), document.end(), [](auto&& entry) {
    return entry.second.is_table() || entry.second.is_array_of_tables();
  });
  // What follows a section header belongs to the section, so there a new key goes to the top.
  if (hasSections) return line + text;
  const bool endsInsideLine = !text.empty() && text.back() != '\n';
  return text + (endsInsideLine ? "\n" : "") + line;
}

std::optional<bool> storedValue(const std::string& text, std::string_view key) {
  try {
    return toml::parse(text)[key].value_exact<bool>();
  } catch (const toml::parse_error&) {
    return std::nullopt;
  }
}

}  // namespace

std::optional<std::string> withSwitch(const std::string& text, std::string_view key, bool value,
                                      std::string& reason) {
  const std::string word = value ? "true" : "false";
  if (!isBareKey(key)) {
    reason = "1: a key is made of letters, digits, '_' and '-'";
    return std::nullopt;
  }
  std::string changed;
  try {
    const toml::table document = toml::parse(text);
    const toml::node* node = document.get(key);
    if (node == nullptr) {
      changed = withNewKey(text, document, std::string(key) + " = " + word + "\n");
    } else {
      const std::size_t begin = offsetOf(text, node->source().begin);
      changed = text;
      changed.replace(begin, offsetOf(text, node->source().end) - begin, word);
    }
    // Values of several lines and sections in the key's place are not worth an editor of their own:
    // what does not read back as wanted is left to a person.
    if (storedValue(changed, key) == value) return changed;
    reason = std::to_string(node == nullptr ? 1 : node->source().begin.line) + ": the value of " +
             std::string(key) + " cannot be replaced; edit the file by hand";
  } catch (const toml::parse_error& error) {
    reason = lineAndReason(error);
  }
  return std::nullopt;
}

}  // namespace zal
