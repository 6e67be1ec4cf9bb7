#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/linux/ipc/access_policy.h"

namespace zal {

/// Who a bus caller is, as the kernel told the bus daemon when it connected.
struct CallerCredentials {
  PeerCredentials peer;
  std::vector<gid_t> groups;  ///< all of them; empty when the daemon does not say
};

/// From the answer of the bus daemon's GetConnectionCredentials. Nothing without a user.
[[nodiscard]] std::optional<CallerCredentials> callerCredentials(
    const std::map<std::string, sdbus::Variant>& answer);

[[nodiscard]] bool admits(const AccessPolicy& policy, const CallerCredentials& caller);

}  // namespace zal
