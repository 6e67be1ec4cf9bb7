#include "platform/linux/log/log_set_name.h"

#include <algorithm>

namespace zal {
namespace {

bool isControl(char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7f; }
bool isContinuationByte(char c) { return (static_cast<unsigned char>(c) & 0xC0U) == 0x80U; }

constexpr std::string_view kEventEnding = "-Event";

}  // namespace

std::string logSetName(std::string_view type) {
  while (!type.empty() && type.back() == '/') type.remove_suffix(1);
  type.remove_prefix(type.rfind('/') + 1);  // npos + 1 is 0
  if (type.size() > kLongestLogSetName) {
    std::size_t end = kLongestLogSetName;
    while (end > 0 && isContinuationByte(type[end])) --end;
    // Bytes that are no UTF-8 have no boundary to look for.
    type = type.substr(0, end > 0 ? end : kLongestLogSetName);
  }
  if (type.empty() || type == "." || type == "..") return std::string(kDefaultLogSetName);
  std::string name(type);
  std::replace_if(name.begin(), name.end(), isControl, '_');
  return name;
}

bool isLogSetName(std::string_view type) {
  return !type.empty() && type.size() <= kLongestLogSetName && type != "." && type != ".." &&
         std::none_of(type.begin(), type.end(), [](char c) { return c == '/' || isControl(c); });
}

bool isEventCategory(std::string_view type, std::string_view category) {
  return category.size() == type.size() + kEventEnding.size() && category.starts_with(type) &&
         category.ends_with(kEventEnding);
}

std::string logFileName(std::string_view setName, bool isEvent) {
  std::string name(setName);
  if (isEvent) name += kEventEnding;
  return name + ".log";
}

}  // namespace zal
