#include "session/build_information_cache.h"

namespace zal {

void BuildInformationCache::refill(SystemVersion& systemVersion,
                                   const std::function<std::optional<std::string>()>& model) {
  if (_osName && _osVersion) return;
  if (const auto values = systemVersion.read()) {
    const auto fill = [&](std::optional<std::string>& slot, const char* key) {
      const auto found = values->find(key);
      if (!slot && found != values->end()) slot = found->second;
    };
    fill(_buildVersion, "ProductBuildVersion");
    fill(_osVersion, "ProductVersion");
    fill(_osName, "ProductName");
  }
  if (!_deviceModel) _deviceModel = model();
}

}  // namespace zal
