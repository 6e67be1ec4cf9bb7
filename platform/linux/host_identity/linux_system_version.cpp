#include "platform/linux/host_identity/linux_system_version.h"

#include <sys/utsname.h>

#include <utility>

#include "platform/linux/config/text_file.h"
#include "platform/linux/host_identity/os_release.h"
#include "platform/linux/property_list/property_list_strings.h"

namespace zal {

namespace {

using Values = std::map<std::string, std::string>;

constexpr const char* kBuildKey = "ProductBuildVersion";
constexpr const char* kVersionKey = "ProductVersion";
constexpr const char* kNameKey = "ProductName";

/// What is absent or empty is left out.
void take(const Values& from, const std::string& name, const std::string& as, Values& into) {
  const auto found = from.find(name);
  if (found != from.end() && !found->second.empty()) into[as] = found->second;
}

std::optional<Values> readPropertyList(const std::string& path) {
  std::string text;
  if (readTextFile(path, text)) return std::nullopt;
  const auto strings = propertyListStrings(text);
  if (!strings) return std::nullopt;
  Values values;
  for (const char* key : {kBuildKey, kVersionKey, kNameKey}) take(*strings, key, key, values);
  return values;
}

Values readHost(const std::string& root) {
  Values values;
  utsname kernel{};
  if (::uname(&kernel) == 0) values[kBuildKey] = kernel.release;
  std::string text;
  for (const char* path : {"/etc/os-release", "/usr/lib/os-release"}) {
    if (readTextFile(root + path, text)) continue;
    const Values release = osReleaseValues(text);
    take(release, "NAME", kNameKey, values);
    take(release, "VERSION_ID", kVersionKey, values);
    take(release, "BUILD_ID", kBuildKey, values);
    break;
  }
  return values;
}

}  // namespace

LinuxSystemVersion::LinuxSystemVersion(std::string propertyList, std::string root)
    : _propertyList(std::move(propertyList)), _root(std::move(root)) {}

std::optional<Values> LinuxSystemVersion::read() {
  _mainThread.check("LinuxSystemVersion");
  if (!_propertyList.empty()) return readPropertyList(_propertyList);
  return readHost(_root);
}

}  // namespace zal
