#include "platform/linux/dialog/dialog_command.h"

#include <algorithm>
#include <string_view>
#include <utility>

#include "platform/linux/alerts/screen_text.h"
#include "platform/linux/files/escaped_text.h"

namespace zal {
namespace {

constexpr std::size_t kLongestTitle = 80;
constexpr std::size_t kLongestButton = 40;
constexpr std::size_t kLongestMessage = 600;
constexpr std::size_t kLongestInitialValue = 4096;
// A telephone's width; a dialog that is wider than the screen has its buttons outside. Where there is no
// text to type, a picture stands beside the message.
constexpr std::size_t kPromptWidth = 44;
constexpr std::size_t kMessageWidth = 36;
constexpr std::size_t kMostLines = 12;

// Statuses that zenity is told to end with: its own take Cancel, Escape and no display for one.
constexpr int kOkStatus = 20;
constexpr int kCancelStatus = 21;
constexpr int kEscapeStatus = 22;
// What a program ends with that was told nothing.
constexpr int kUntoldOkStatus = 0;
constexpr int kUntoldCancelStatus = 1;
// kdialog's: its second button, and a window that was closed. A text field has one for both, the first.
constexpr int kNoStatus = 1;
constexpr int kClosedStatus = 2;

std::string title(const UserAlert& alert) { return screenLine(alert.title, kLongestTitle); }

std::string button(std::string_view label) { return screenLine(label, kLongestButton); }

std::string initialValue(const UserAlert& alert) {
  return screenLine(alert.textField->initialValue, kLongestInitialValue);
}

std::string message(const UserAlert& alert) {
  std::string text = screenText(alert.message, kLongestMessage);
  if (alert.textField && !alert.textField->title.empty()) {
    text += "\n" + screenLine(alert.textField->title, kLongestTitle);
  }
  return foldedText(text, alert.textField ? kPromptWidth : kMessageWidth, kMostLines);
}

/// Each of the characters twice, which is how they are meant as they are.
std::string doubled(std::string_view text, std::string_view characters) {
  std::string result;
  for (const char c : text) {
    result.append(characters.find(c) != std::string_view::npos ? 2 : 1, c);
  }
  return result;
}

std::string mnemonic(std::string_view label) { return doubled(button(label), "_"); }

/// A label that is not given is the program's own word.
void addLabel(std::vector<std::string>& words, std::string_view option, const std::string& label) {
  if (!label.empty()) words.push_back(std::string(option) + label);
}

std::vector<std::string> zenityEntry(const UserAlert& alert) {
  std::vector<std::string> words{"--entry", "--title=" + title(alert),
                                 "--text=" + doubled(message(alert), "\\_"),
                                 "--entry-text=" + initialValue(alert)};
  addLabel(words, "--ok-label=", button(alert.defaultButton));
  addLabel(words, "--cancel-label=", button(alert.alternateButton.value_or("")));
  if (alert.otherButton) addLabel(words, "--extra-button=", mnemonic(*alert.otherButton));
  words.emplace_back("--width=360");
  return words;
}

std::vector<std::string> zenityMessage(const UserAlert& alert) {
  const bool asks = alert.alternateButton.has_value() || alert.otherButton.has_value();
  std::vector<std::string> words{asks ? "--question" : "--info", "--title=" + title(alert), "--no-markup",
                                 "--text=" + message(alert)};
  addLabel(words, "--ok-label=", asks ? mnemonic(alert.defaultButton) : button(alert.defaultButton));
  if (asks) addLabel(words, "--cancel-label=", mnemonic(alert.alternateButton.value_or("")));
  if (alert.otherButton) addLabel(words, "--extra-button=", mnemonic(*alert.otherButton));
  return words;
}

/// As text that begins with a tag, so that nobody guesses whether it is markup.
std::string kdialogText(std::string_view text, std::string_view ampersand) {
  std::string result = "<qt>";
  for (const char c : text) {
    if (c == '&') {
      result += ampersand;
    } else if (c == '<') {
      result += "&lt;";
    } else if (c == '\n') {
      result += "<br>";
    } else {
      result.append(c == '\\' ? 2 : 1, c);
    }
  }
  return result += "</qt>";
}

std::string kdialogButton(std::string_view label) { return doubled(button(label), "&"); }

std::optional<std::vector<std::string>> kdialogWords(const UserAlert& alert) {
  if (alert.otherButton) return std::nullopt;  // its third button is closing the window, too
  std::vector<std::string> words{"--title=" + title(alert)};
  if (alert.textField) {
    // Beside a text field a single one would be the letter behind it, underlined.
    words.push_back("--inputbox=" + kdialogText(message(alert), "&amp;&amp;"));
    words.emplace_back("--");
    words.push_back(initialValue(alert));
    return words;
  }
  const std::string text = kdialogText(message(alert), "&amp;");
  if (alert.alternateButton) {
    addLabel(words, "--yes-label=", kdialogButton(alert.defaultButton));
    addLabel(words, "--no-label=", kdialogButton(*alert.alternateButton));
    words.push_back("--yesno=" + text);
  } else {
    words.push_back("--msgbox=" + text);
  }
  return words;
}

bool containsIgnoringCase(std::string_view text, std::string_view word) {
  const auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; };
  return std::search(text.begin(), text.end(), word.begin(), word.end(),
                     [&](char a, char b) { return lower(a) == b; }) != text.end();
}

/// The last thing that it had to say.
std::string lastWords(std::string_view errors) {
  while (errors.ends_with('\n')) errors.remove_suffix(1);
  const std::size_t start = errors.rfind('\n');
  if (start != std::string_view::npos) errors.remove_prefix(start + 1);
  return escapedLine(cutAtCharacter(errors, 200));
}

std::string failure(const DialogOutcome& outcome) {
  const std::string words = lastWords(outcome.errors);
  if (!words.empty()) return words;
  if (outcome.status < 0) return "it was ended by signal " + std::to_string(-outcome.status);
  return "it ended with status " + std::to_string(outcome.status);
}

std::string withoutLineEnd(std::string text) {
  if (text.ends_with('\n')) text.pop_back();
  return text;
}

AlertAnswer defaultAnswer(const UserAlert& alert, const std::string& output) {
  AlertAnswer answer{AlertResponse::kDefaultButton};
  if (alert.textField) answer.text = withoutLineEnd(output);
  return answer;
}

/// Programs say "no display" with the status of a button.
bool missesDisplay(const DialogOutcome& outcome) { return containsIgnoringCase(outcome.errors, "display"); }

std::optional<AlertAnswer> zenityAnswer(const UserAlert& alert, const DialogOutcome& outcome) {
  if (outcome.status == kOkStatus || outcome.status == kUntoldOkStatus) {
    return defaultAnswer(alert, outcome.output);
  }
  const bool isCancel = outcome.status == kCancelStatus || outcome.status == kEscapeStatus ||
                        (outcome.status == kUntoldCancelStatus && !missesDisplay(outcome));
  if (!isCancel) return std::nullopt;
  // The status of a further button depends on the program's version; that it prints its label does not.
  const std::string printed = withoutLineEnd(outcome.output);
  if (alert.otherButton && !printed.empty() && printed == mnemonic(*alert.otherButton)) {
    return AlertAnswer{AlertResponse::kOtherButton};
  }
  const bool isButton = outcome.status == kCancelStatus && alert.alternateButton.has_value();
  return AlertAnswer{isButton ? AlertResponse::kAlternateButton : AlertResponse::kCancelled};
}

std::optional<AlertAnswer> kdialogAnswer(const UserAlert& alert, const DialogOutcome& outcome) {
  if (outcome.status == kUntoldOkStatus) return defaultAnswer(alert, outcome.output);
  if (outcome.status == kClosedStatus) return AlertAnswer{AlertResponse::kCancelled};
  if (outcome.status != kNoStatus || missesDisplay(outcome)) return std::nullopt;
  const bool isButton = alert.alternateButton.has_value() && !alert.textField;
  return AlertAnswer{isButton ? AlertResponse::kAlternateButton : AlertResponse::kCancelled};
}

}  // namespace

std::optional<std::vector<std::string>> dialogArguments(DialogProgram program, const UserAlert& alert) {
  if (program == DialogProgram::kdialog) return kdialogWords(alert);
  return alert.textField ? zenityEntry(alert) : zenityMessage(alert);
}

std::vector<std::string> dialogEnvironment(std::vector<std::string> variables) {
  const std::vector<std::string> own{
      "GTK_USE_PORTAL=0",
      "NO_AT_BRIDGE=1",  // it asks no further daemon
      "LC_ALL=C.UTF-8",  // it prints what was typed, and messages that can be read
      "ZENITY_OK=" + std::to_string(kOkStatus),
      "ZENITY_CANCEL=" + std::to_string(kCancelStatus),
      "ZENITY_ESC=" + std::to_string(kEscapeStatus)};
  std::erase_if(variables, [&](const std::string& variable) {
    return std::any_of(own.begin(), own.end(), [&](const std::string& one) {
      return variable.starts_with(one.substr(0, one.find('=') + 1));
    });
  });
  variables.insert(variables.end(), own.begin(), own.end());
  return variables;
}

std::optional<AlertAnswer> dialogAnswer(DialogProgram program, const UserAlert& alert,
                                        const DialogOutcome& outcome, std::string& reason) {
  const auto answer =
      program == DialogProgram::kdialog ? kdialogAnswer(alert, outcome) : zenityAnswer(alert, outcome);
  if (!answer) reason = failure(outcome);
  return answer;
}

}  // namespace zal
