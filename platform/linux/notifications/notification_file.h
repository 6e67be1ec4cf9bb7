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

/// Whether a post can carry the id: 1 to 64 letters and digits.
[[nodiscard]] bool isPostId(std::string_view id);

/// The hidden name under which a post with an id is made, before it is renamed.
[[nodiscard]] std::string nameOfPost(std::string_view id);
/// The id in such a name; empty when it has none.
[[nodiscard]] std::string_view idOfPost(std::string_view formerName);

/// Posts to everybody who watches the directory. For any process; any thread. A post that is sent
/// another way too has an id, by which who hears both knows them for one. Returned: an error,
/// `invalid_argument` for a name that no notification can have, or an id that no post can.
[[nodiscard]] std::error_code postNotification(const std::string& directory, std::string_view name,
                                               std::string_view id = {});

}  // namespace zal
