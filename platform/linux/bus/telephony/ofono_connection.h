#pragma once

#include <functional>
#include <memory>
#include <string_view>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/telephony.h"

namespace zal {

/// oFono as the telephony service, asked over a connection of the caller's own; nothing when nobody has
/// its name. Each interface of the modem in use is asked once, when the first question about it comes,
/// for at most a second; after an oFono that has stopped answering every other question fails at once.
/// `dumpBaseband` is what a baseband dump is handed to, since oFono has none.
[[nodiscard]] std::unique_ptr<TelephonyConnection> openOfono(
    std::unique_ptr<sdbus::IConnection> bus, std::function<void(std::string_view reason)> dumpBaseband);

}  // namespace zal
