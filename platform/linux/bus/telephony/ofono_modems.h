#pragma once

#include <string>
#include <vector>

#include "platform/linux/bus/telephony/ofono_answers.h"

namespace zal {

inline constexpr const char* kOfonoService = "org.ofono";
/// "org.ofono.Modem" for "Modem".
[[nodiscard]] inline std::string ofonoInterface(const std::string& name) { return "org.ofono." + name; }

/// What the manager's GetModems gives: object paths and properties, in oFono's order.
using OfonoModems = std::vector<sdbus::Struct<sdbus::ObjectPath, OfonoProperties>>;

/// The first one that is powered and online, else the first one; nothing of none.
[[nodiscard]] const OfonoModems::value_type* modemInUse(const OfonoModems& modems);

}  // namespace zal
