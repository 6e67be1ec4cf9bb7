#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/linux/alerts/alert_record.h"

namespace zal {

// An agent's alerts as other programs see and answer them: files of a directory that only its owner
// can enter. Any process, any thread; nothing here waits.

/// Where a runtime directory keeps its alerts.
[[nodiscard]] std::string alertDirectory(const std::string& runtimeRoot);

/// The number that an id stands for; nothing for what is no id.
[[nodiscard]] std::optional<unsigned> alertNumber(std::string_view id);

/// All alerts, the oldest first; files that are none are left out. One that still waits in its file,
/// but whose agent is gone, reads as cut off.
[[nodiscard]] std::vector<AlertRecord> listAlerts(const std::string& directory);
/// One of them; nothing when there is none.
[[nodiscard]] std::optional<AlertRecord> readAlert(const std::string& directory, std::string_view id);

/// Gives the agent an answer: `button` is "default", "alternate", "other" or "cancel". The agent takes
/// it a moment later. Returned: why it was not given, in one sentence, or nothing.
[[nodiscard]] std::optional<std::string> answerAlert(const std::string& directory, std::string_view id,
                                                     std::string_view button,
                                                     const std::optional<std::string>& text);

// For the agent's side.

inline constexpr std::string_view kAlertRecordEnding = ".toml";
inline constexpr std::string_view kAlertAnswerEnding = ".answer";
/// Bytes of an answer's file; a larger one is refused.
inline constexpr std::size_t kLargestAlertAnswer = std::size_t{64} << 10U;

}  // namespace zal
