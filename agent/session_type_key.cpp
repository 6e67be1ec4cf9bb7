#include "agent/session_type_key.h"

#include <algorithm>

namespace zal {
namespace {

bool isControl(char c) {
  const auto byte = static_cast<unsigned char>(c);
  return byte < 0x20 || byte == 0x7F;
}

bool continuesCharacter(char c) { return (static_cast<unsigned char>(c) & 0xC0U) == 0x80U; }

std::string_view lastPathComponent(std::string_view path) {
  while (!path.empty() && path.back() == '/') path.remove_suffix(1);
  const std::size_t slash = path.rfind('/');
  return slash == std::string_view::npos ? path : path.substr(slash + 1);
}

}  // namespace

std::string_view sessionTypeOrDefault(std::optional<std::string_view> type) {
  return type.has_value() && !type->empty() ? *type : kDefaultSessionType;
}

std::string sessionTypeKey(std::optional<std::string_view> type) {
  std::string_view name = lastPathComponent(sessionTypeOrDefault(type));
  if (name.empty() || name == "." || name == "..") return std::string(kDefaultSessionType);
  if (name.size() > kLongestSessionTypeKey) {
    std::size_t length = kLongestSessionTypeKey;
    while (length > 0 && continuesCharacter(name[length])) --length;
    name = name.substr(0, length);
  }
  std::string key(name);
  std::replace_if(key.begin(), key.end(), isControl, '_');
  return key;
}

}  // namespace zal
