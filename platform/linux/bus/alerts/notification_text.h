#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/user_alerts.h"

namespace zal {

/// What of a notification server's capabilities matters to us.
struct NotificationAbilities {
  bool hasActions = false;
  bool hasBody = false;
  bool readsMarkup = false;  ///< in the body
};

/// An alert as the arguments of org.freedesktop.Notifications.Notify.
struct NotificationText {
  std::string icon;
  std::string summary;
  std::string body;
  std::vector<std::string> actions;  ///< key, label, key, label
  std::uint8_t urgency = 1;          ///< 1 or 2: 0 is not shown at once everywhere
};

// Pure functions.

[[nodiscard]] NotificationAbilities notificationAbilities(const std::vector<std::string>& capabilities);
[[nodiscard]] NotificationText notificationText(const UserAlert& alert,
                                                const NotificationAbilities& abilities);
/// The button that an action's key stands for; nothing for a key that is none of ours.
[[nodiscard]] std::optional<int> notificationButton(std::string_view key);

}  // namespace zal
