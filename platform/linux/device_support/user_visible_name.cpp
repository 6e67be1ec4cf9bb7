#include "platform/linux/device_support/user_visible_name.h"

#include "platform/linux/host_identity/os_release.h"
#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

bool hasNoPlaceInAName(char32_t codePoint) {
  return codePoint < 0x20 || (codePoint >= 0x7F && codePoint <= 0x9F) || codePoint == 0x2028 ||
         codePoint == 0x2029;
}

std::string cleanName(std::string_view bytes) {
  const std::string text = replacedUtf8(bytes);
  std::string name;
  for (std::string_view rest = text; !rest.empty();) {
    const Utf8Step step = nextUtf8(rest);
    if (!hasNoPlaceInAName(step.codePoint)) name += rest.substr(0, step.size);
    rest.remove_prefix(step.size);
  }
  const auto first = name.find_first_not_of(' ');
  if (first == std::string::npos) return {};
  return name.substr(first, name.find_last_not_of(' ') - first + 1);
}

}  // namespace

std::string userVisibleName(std::string_view machineInfo, std::string_view hostName) {
  const auto values = osReleaseValues(machineInfo);
  const auto pretty = values.find("PRETTY_HOSTNAME");
  std::string name = pretty != values.end() ? cleanName(pretty->second) : std::string();
  return name.empty() ? cleanName(hostName) : name;
}

}  // namespace zal
