#pragma once

#include <string>
#include <string_view>
#include <system_error>

namespace zal {

/// Where a runtime directory keeps its notifications.
[[nodiscard]] std::string notificationDirectory(const std::string& runtimeRoot);

/// Whether a notification can have the name: a plain file name of 1 to 200 bytes without control
/// characters that does not begin with a dot (those are files still being made).
[[nodiscard]] bool isNotificationName(std::string_view name);

/// Makes the directory, with its missing parents, for its owner alone. An existing one is fine.
[[nodiscard]] std::error_code makeNotificationDirectory(const std::string& directory);

/// Posts to everybody who watches the directory. For any process; any thread. Returned: an error,
/// `invalid_argument` for a name that no notification can have.
[[nodiscard]] std::error_code postNotification(const std::string& directory, std::string_view name);

}  // namespace zal
