#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/clock.h"
#include "platform/linux/alerts/alert_answer.h"
#include "platform/linux/process/process_identity.h"
#include "platform/user_alerts.h"

namespace zal {

enum class AlertState {
  waiting,
  answered,
  cutOff,    ///< the agent ended first
  timedOut,  ///< the alert's own time ran out
};

/// One alert as its file tells it.
struct AlertRecord {
  std::string id;  ///< the file's name without its ending: a number, what people type
  UserAlert alert;
  WallTime posted{};
  ProcessIdentity agent;  ///< that posted it
  AlertState state = AlertState::waiting;
  std::optional<AlertAnswer> answer;  ///< when answered
};

/// "waiting", "answered", "cut off", "timed out".
[[nodiscard]] std::string_view alertStateText(AlertState state);
/// Why an alert got no answer, in half a sentence; empty for those that wait or have one.
[[nodiscard]] std::string_view alertStateReason(AlertState state);

/// "default", "alternate", "other", "cancel"; the number is AlertResponse's.
[[nodiscard]] std::string_view alertButtonName(int code);
[[nodiscard]] std::optional<int> alertButtonCode(std::string_view name);
/// Whether the alert has the button; every alert can be cancelled.
[[nodiscard]] bool alertHasButton(const UserAlert& alert, int code);
/// Whether it asks nothing: one button, no text field.
[[nodiscard]] bool isNotice(const UserAlert& alert);

/// The alert as a record holds it: texts are well-formed and of bounded size.
[[nodiscard]] UserAlert boundedAlert(UserAlert alert);

/// The file's text (TOML), id aside: docs/runtime-directory.md.
[[nodiscard]] std::string alertRecordText(const AlertRecord& record);
/// The reverse; nothing when the text is no such record. Whatever stands in it, nothing worse happens.
[[nodiscard]] std::optional<AlertRecord> parseAlertRecord(std::string_view text);

/// The text of an answer's file (TOML).
[[nodiscard]] std::string alertAnswerText(const AlertAnswer& answer);
/// The reverse; nothing, and the reason in half a sentence, when it is no answer.
[[nodiscard]] std::optional<AlertAnswer> parseAlertAnswer(std::string_view text, std::string& reason);

}  // namespace zal
