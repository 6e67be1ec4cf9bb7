#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "session/optional_text.h"

namespace zal {

/// What stands for a sender who gave no name, except in lines of checkpoints.
inline constexpr std::string_view kNoSender = "No Sender";

// The lines of session logs, without their newline. A time text is an entry's ("14:03:07.251
// (2024-05-02) (CEST)"); a sender comes as it shall be shown, except where it is optional.

[[nodiscard]] std::string beginLine(std::string_view sender, std::string_view timeText);
[[nodiscard]] std::string endLine(std::string_view sender, std::string_view timeText);
[[nodiscard]] std::string checkpointLine(OptionalText checkpoint, OptionalText sender,
                                         std::string_view timeText);
/// Of a description and its log, of which either or both may be missing.
[[nodiscard]] std::string descriptionLine(OptionalText description, OptionalText log, std::string_view sender,
                                          std::string_view timeText);
[[nodiscard]] std::string metricLine(std::string_view name, std::string_view value, std::string_view sender,
                                     std::string_view timeText);
/// "[label: value]", or nothing when either is missing.
[[nodiscard]] std::optional<std::string> headerLine(OptionalText label, OptionalText value);
/// The same line as the agent's own log shows it.
[[nodiscard]] std::string echoOf(std::string_view line);

}  // namespace zal
