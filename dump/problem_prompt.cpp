#include "dump/problem_prompt.h"

namespace zal {
namespace {

constexpr const char* kIdentifier = "__ksLirraUserInputNotificationForTitleAndMessageIdentifier";
/// Somebody waits for the answer: in front of everything else on the screen.
constexpr int kUrgent = 3;

}  // namespace

UserAlert ProblemPrompt(const std::optional<std::string>& title, const std::optional<std::string>& message,
                        const std::optional<std::string>& defaultButton,
                        const std::optional<std::string>& alternateButton) {
  UserAlert alert;
  alert.identifier = kIdentifier;
  alert.title = title.value_or("Title");
  alert.message = message.value_or("Message");
  alert.defaultButton = defaultButton.value_or("OK");
  alert.alternateButton = alternateButton;
  alert.textField = UserAlert::TextField{};
  alert.timeout = 0;
  alert.level = kUrgent;
  alert.displayFlags = 0;
  return alert;
}

std::optional<std::string> typedText(const AlertResponse& response) {
  const auto* const text = response.textFieldValue.as<std::string>();
  return text != nullptr && !text->empty() ? std::optional<std::string>(*text) : std::nullopt;
}

}  // namespace zal
