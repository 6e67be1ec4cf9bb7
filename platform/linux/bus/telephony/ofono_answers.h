#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/telephony.h"

namespace zal {

/// What GetProperties of one interface gave, by name.
using OfonoProperties = std::map<std::string, sdbus::Variant>;
/// The properties of the modem's interface "org.ofono." + name; nothing where it has no such interface.
/// Owned by the callee.
using OfonoInterfaces = std::function<const OfonoProperties*(const std::string& name)>;

/// From NetworkRegistration's percentage; nothing where it has none, or what it has is none.
[[nodiscard]] std::optional<CellularSignal> ofonoSignal(const OfonoProperties& networkRegistration);

/// What oFono's properties say to the question. oFono leaves out what it does not know: a text that is
/// left out has no value, a yes or no or a number failed, for either would claim something. (Whether data
/// are suspended is left out while they are not attached: that has no value.) A property of another type
/// than documented fails. All questions but packetContextCount, which no property answers.
[[nodiscard]] std::optional<CellularAnswer> ofonoAnswer(CellularQuery query,
                                                        const OfonoInterfaces& interfaces);

}  // namespace zal
