#pragma once

#include <optional>
#include <string>
#include <vector>

#include "platform/linux/alerts/alert_answer.h"
#include "platform/user_alerts.h"

namespace zal {

/// The programs that show a dialog, in the order of preference.
enum class DialogProgram {
  zenity,
  kdialog,
};

/// How a dialog's program ended.
struct DialogOutcome {
  int status = 0;      ///< exit status; minus the signal that ended it
  std::string output;  ///< what it printed, whole or its beginning
  std::string errors;
};

// What a dialog's program is told, and what it tells. Pure functions.

/// The words after the program's name; nothing when that program has no such dialog. No word is read
/// as an option, as markup or as an escape, whatever the alert's texts are.
[[nodiscard]] std::optional<std::vector<std::string>> dialogArguments(DialogProgram program,
                                                                      const UserAlert& alert);
/// The program's environment: what is for children of ours, given as "NAME=value", with what makes its
/// answers readable.
[[nodiscard]] std::vector<std::string> dialogEnvironment(std::vector<std::string> variables);
/// What the person did, as that program tells it; nothing, and the reason in half a sentence, when the dialog
/// was not seen or was ended by somebody else.
[[nodiscard]] std::optional<AlertAnswer> dialogAnswer(DialogProgram program, const UserAlert& alert,
                                                      const DialogOutcome& outcome, std::string& reason);

}  // namespace zal
