#include "platform/linux/alerts/alert_record.h"

#include <array>
#include <limits>
#include <sstream>
#include <utility>

#include <toml++/toml.h>

#include "platform/linux/config/toml_error.h"
#include "platform/linux/files/escaped_text.h"
#include "platform/linux/files/unix_milliseconds.h"
#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

constexpr std::size_t kLongestText = 4096;
constexpr std::size_t kLongestKey = 256;
constexpr std::size_t kMostInformation = 16;

constexpr std::array<std::string_view, 4> kButtons = {"default", "alternate", "other", "cancel"};
constexpr std::string_view kFromScreen = "screen";
constexpr std::array<std::string_view, 4> kStates = {"waiting", "answered", "cut off", "timed out"};

template <std::size_t Count>
std::optional<int> indexOf(const std::array<std::string_view, Count>& names, std::string_view name) {
  for (std::size_t i = 0; i < Count; ++i) {
    if (names[i] == name) return static_cast<int>(i);
  }
  return std::nullopt;
}

std::string bounded(std::string_view text, std::size_t most = kLongestText) {
  return replacedUtf8(cutAtCharacter(text, most));
}

std::optional<std::string> text(const toml::table& table, std::string_view key) {
  return table[key].value_exact<std::string>();
}

/// The number when the target can hold it.
template <class Target>
std::optional<Target> number(const toml::table& table, std::string_view key) {
  const auto value = table[key].value_exact<std::int64_t>();
  if (!value || !std::in_range<Target>(*value)) return std::nullopt;
  return static_cast<Target>(*value);
}

/// As few notations as possible: one line for each key, so that any editor and any script can read it.
std::string tomlText(const toml::table& table) {
  using Flags = toml::format_flags;
  std::ostringstream out;
  out << toml::toml_formatter(table, toml::toml_formatter::default_flags & ~Flags::allow_literal_strings &
                                         ~Flags::allow_multi_line_strings);
  out << '\n';
  return std::move(out).str();
}

void insertText(toml::table& table, std::string_view key, const std::optional<std::string>& value) {
  if (value) table.insert(key, *value);
}

std::optional<toml::table> parsed(std::string_view text, std::string& reason) {
  try {
    return toml::parse(text);
  } catch (const toml::parse_error& error) {
    reason = "line " + lineAndReason(error);
    return std::nullopt;
  }
}

UserAlert alertOf(const toml::table& table) {
  UserAlert alert;
  alert.identifier = text(table, "identifier").value_or("");
  alert.title = text(table, "title").value_or("");
  alert.message = text(table, "message").value_or("");
  alert.defaultButton = text(table, "defaultButton").value_or("");
  alert.alternateButton = text(table, "alternateButton");
  alert.otherButton = text(table, "otherButton");
  if (const toml::table* field = table["textField"].as_table()) {
    alert.textField = {text(*field, "title").value_or(""), text(*field, "initialValue").value_or("")};
  }
  alert.timeout = table["timeout"].value<double>().value_or(0);
  alert.level = number<int>(table, "level").value_or(0);
  alert.displayFlags = number<unsigned>(table, "displayFlags").value_or(0);
  if (const toml::table* information = table["information"].as_table()) {
    for (auto&& [key, node] : *information) {
      if (const auto value = node.value_exact<std::string>()) alert.information.emplace(key.str(), *value);
    }
  }
  return alert;
}

}  // namespace

std::string_view alertStateText(AlertState state) { return kStates.at(static_cast<std::size_t>(state)); }

std::string_view alertStateReason(AlertState state) {
  if (state == AlertState::cutOff) return "the agent ended before it was answered";
  if (state == AlertState::timedOut) return "nobody answered in time";
  return {};
}

std::string_view alertButtonName(int code) {
  const bool known = code >= 0 && std::cmp_less(code, kButtons.size());
  return kButtons[static_cast<std::size_t>(known ? code : AlertResponse::kCancelled)];
}

std::optional<int> alertButtonCode(std::string_view name) { return indexOf(kButtons, name); }

bool alertHasButton(const UserAlert& alert, int code) {
  if (code == AlertResponse::kAlternateButton) return alert.alternateButton.has_value();
  if (code == AlertResponse::kOtherButton) return alert.otherButton.has_value();
  return code == AlertResponse::kDefaultButton || code == AlertResponse::kCancelled;
}

bool isNotice(const UserAlert& alert) {
  return !alert.alternateButton && !alert.otherButton && !alert.textField;
}

UserAlert boundedAlert(UserAlert alert) {
  for (std::string* piece : {&alert.identifier, &alert.title, &alert.message, &alert.defaultButton}) {
    *piece = bounded(*piece);
  }
  for (auto* piece : {&alert.alternateButton, &alert.otherButton}) {
    if (*piece) *piece = bounded(**piece);
  }
  if (alert.textField) {
    alert.textField->title = bounded(alert.textField->title);
    alert.textField->initialValue = bounded(alert.textField->initialValue);
  }
  std::map<std::string, std::string> information;
  for (const auto& [key, value] : alert.information) {
    if (information.size() == kMostInformation) break;
    information.emplace(bounded(key, kLongestKey), bounded(value));
  }
  alert.information = std::move(information);
  return alert;
}

std::string alertRecordText(const AlertRecord& record) {
  const UserAlert& alert = record.alert;
  toml::table table;
  table.insert("identifier", alert.identifier);
  table.insert("title", alert.title);
  table.insert("message", alert.message);
  table.insert("defaultButton", alert.defaultButton);
  insertText(table, "alternateButton", alert.alternateButton);
  insertText(table, "otherButton", alert.otherButton);
  if (alert.textField) {
    table.insert("textField", toml::table{{"title", alert.textField->title},
                                          {"initialValue", alert.textField->initialValue}});
  }
  table.insert("timeout", alert.timeout);
  table.insert("level", static_cast<std::int64_t>(alert.level));
  table.insert("displayFlags", static_cast<std::int64_t>(alert.displayFlags));
  toml::table information;
  for (const auto& [key, value] : alert.information) information.insert(key, value);
  if (!information.empty()) table.insert("information", std::move(information));
  table.insert("posted", unixMilliseconds(record.posted));
  table.insert("agentProcess", static_cast<std::int64_t>(record.agent.processId));
  table.insert("agentStart", static_cast<std::int64_t>(record.agent.startTime));
  table.insert("state", alertStateText(record.state));
  const std::string_view reason = alertStateReason(record.state);
  if (!reason.empty()) table.insert("reason", reason);
  if (record.answer) {
    toml::table response{{"button", alertButtonName(record.answer->code)}};
    insertText(response, "text", record.answer->text);
    if (record.answer->isFromScreen) response.insert("from", kFromScreen);
    table.insert("response", std::move(response));
  }
  return tomlText(table);
}

std::optional<AlertRecord> parseAlertRecord(std::string_view source) {
  std::string reason;
  const auto table = parsed(source, reason);
  if (!table) return std::nullopt;
  const auto milliseconds = number<std::int64_t>(*table, "posted");
  const auto posted = milliseconds ? momentOfUnixMilliseconds(*milliseconds) : std::nullopt;
  const auto process = number<pid_t>(*table, "agentProcess");
  const auto start = number<std::uint64_t>(*table, "agentStart");
  const auto state = indexOf(kStates, text(*table, "state").value_or(""));
  if (!posted || !process || !start || !state) return std::nullopt;
  AlertRecord record;
  record.alert = alertOf(*table);
  record.posted = *posted;
  record.agent = {*process, *start};
  record.state = static_cast<AlertState>(*state);
  if (const toml::table* response = (*table)["response"].as_table()) {
    const auto code = alertButtonCode(text(*response, "button").value_or(""));
    const bool isFromScreen = text(*response, "from") == kFromScreen;
    if (code) record.answer = AlertAnswer{*code, text(*response, "text"), isFromScreen};
  }
  return record;
}

std::string alertAnswerText(const AlertAnswer& answer) {
  toml::table table{{"button", alertButtonName(answer.code)}};
  if (answer.text) table.insert("text", replacedUtf8(*answer.text));
  return tomlText(table);
}

std::optional<AlertAnswer> parseAlertAnswer(std::string_view source, std::string& reason) {
  const auto table = parsed(source, reason);
  if (!table) return std::nullopt;
  const auto button = text(*table, "button");
  if (!button) {
    reason = "it names no button";
    return std::nullopt;
  }
  const auto code = alertButtonCode(*button);
  if (!code) {
    reason = "there is no button \"" + escapedLine(cutAtCharacter(*button, 100)) + "\"";
    return std::nullopt;
  }
  if (table->contains("text") && !text(*table, "text")) {
    reason = "its text is none";
    return std::nullopt;
  }
  return AlertAnswer{*code, text(*table, "text")};
}

}  // namespace zal
