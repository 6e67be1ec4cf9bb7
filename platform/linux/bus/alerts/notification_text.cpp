#include "platform/linux/bus/alerts/notification_text.h"

#include <algorithm>

#include "platform/linux/alerts/alert_record.h"
#include "platform/linux/alerts/screen_text.h"

namespace zal {
namespace {

constexpr std::size_t kLongestSummary = 120;
constexpr std::size_t kLongestBody = 1000;
constexpr std::size_t kLongestLabel = 40;
constexpr int kUrgentLevel = 2;
constexpr std::uint8_t kNormal = 1;
constexpr std::uint8_t kCritical = 2;

std::string withoutMarkup(std::string_view text) {
  std::string result;
  for (const char c : text) {
    if (c == '&') {
      result += "&amp;";
    } else if (c == '<') {
      result += "&lt;";
    } else if (c == '>') {
      result += "&gt;";
    } else {
      result += c;
    }
  }
  return result;
}

void addAction(NotificationText& text, int button, const std::string& label) {
  text.actions.emplace_back(alertButtonName(button));
  text.actions.push_back(screenLine(label, kLongestLabel));
}

}  // namespace

NotificationAbilities notificationAbilities(const std::vector<std::string>& capabilities) {
  const auto has = [&](const char* name) {
    return std::find(capabilities.begin(), capabilities.end(), name) != capabilities.end();
  };
  return {has("actions"), has("body"), has("body-markup")};
}

NotificationText notificationText(const UserAlert& alert, const NotificationAbilities& abilities) {
  NotificationText text;
  text.icon = isNotice(alert) ? "dialog-information" : "dialog-question";
  text.summary = screenLine(alert.title, kLongestSummary);
  text.body = screenText(alert.message, kLongestBody);
  if (!abilities.hasBody) {
    text.summary += ": " + screenLine(alert.message, kLongestBody);
    text.body.clear();
  }
  if (abilities.readsMarkup) text.body = withoutMarkup(text.body);
  addAction(text, AlertResponse::kDefaultButton, alert.defaultButton);
  if (alert.alternateButton) addAction(text, AlertResponse::kAlternateButton, *alert.alternateButton);
  if (alert.otherButton) addAction(text, AlertResponse::kOtherButton, *alert.otherButton);
  text.urgency = alert.level >= kUrgentLevel ? kCritical : kNormal;
  return text;
}

std::optional<int> notificationButton(std::string_view key) {
  const auto code = alertButtonCode(key);
  return code == AlertResponse::kCancelled ? std::nullopt : code;
}

}  // namespace zal
