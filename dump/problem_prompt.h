#pragma once

#include <optional>
#include <string>

#include "platform/user_alerts.h"

namespace zal {

/// An alert with one line to fill in. Texts that are not given read "Title", "Message" and "OK";
/// without an alternate title there is one button.
[[nodiscard]] UserAlert ProblemPrompt(const std::optional<std::string>& title,
                                      const std::optional<std::string>& message,
                                      const std::optional<std::string>& defaultButton,
                                      const std::optional<std::string>& alternateButton);

/// What was typed into it; nothing when that is empty or no text.
[[nodiscard]] std::optional<std::string> typedText(const AlertResponse& response);

}  // namespace zal
