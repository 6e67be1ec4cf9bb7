#include "platform/linux/bus/telephony/ofono_modems.h"

#include <algorithm>

namespace zal {
namespace {

bool isOn(const OfonoProperties& properties, const char* name) {
  const auto found = properties.find(name);
  return found != properties.end() && found->second.containsValueOfType<bool>() && found->second.get<bool>();
}

}  // namespace

const OfonoModems::value_type* modemInUse(const OfonoModems& modems) {
  const auto used = std::find_if(modems.begin(), modems.end(), [](const auto& modem) {
    return isOn(modem.template get<1>(), "Powered") && isOn(modem.template get<1>(), "Online");
  });
  if (used != modems.end()) return &*used;
  return modems.empty() ? nullptr : &modems.front();
}

}  // namespace zal
