#include "platform/linux/alerts/alert_file.h"

#include <algorithm>
#include <charconv>
#include <filesystem>
#include <utility>

#include "platform/linux/config/text_file.h"
#include "platform/linux/files/escaped_text.h"
#include "platform/linux/files/whole_file.h"

namespace zal {
namespace {

constexpr std::size_t kLongestId = 9;

std::string shown(std::string_view text) { return escapedLine(cutAtCharacter(text, 100)); }

/// Why the alert takes no answer any more; empty when it does.
std::string refusal(const AlertRecord& record) {
  if (record.state == AlertState::waiting) return {};
  const std::string name = "Alert " + record.id;
  if (record.state == AlertState::answered) return name + " has been answered already.";
  return name + " takes no answer any more: " + std::string(alertStateReason(record.state)) + ".";
}

}  // namespace

std::string alertDirectory(const std::string& runtimeRoot) { return runtimeRoot + "/alerts"; }

std::optional<unsigned> alertNumber(std::string_view id) {
  if (id.empty() || id.size() > kLongestId || id.front() == '0') return std::nullopt;
  unsigned number = 0;
  const auto [end, error] = std::from_chars(id.data(), id.data() + id.size(), number);
  if (error != std::errc{} || end != id.data() + id.size()) return std::nullopt;
  return number;
}

std::optional<AlertRecord> readAlert(const std::string& directory, std::string_view id) {
  if (!alertNumber(id)) return std::nullopt;
  std::string text;
  if (readTextFile(directory + "/" + std::string(id).append(kAlertRecordEnding), text)) return std::nullopt;
  auto record = parseAlertRecord(text);
  if (!record) return std::nullopt;
  record->id = id;
  if (record->state == AlertState::waiting && !record->agent.isRunning()) record->state = AlertState::cutOff;
  return record;
}

std::vector<AlertRecord> listAlerts(const std::string& directory) {
  std::vector<std::pair<unsigned, AlertRecord>> found;
  std::error_code error;
  for (std::filesystem::directory_iterator entry(directory, error), end; !error && entry != end;
       entry.increment(error)) {
    if (entry->path().extension().string() != kAlertRecordEnding) continue;
    const std::string id = entry->path().stem().string();
    if (auto record = readAlert(directory, id)) found.emplace_back(*alertNumber(id), std::move(*record));
  }
  std::sort(found.begin(), found.end(), [](const auto& a, const auto& b) { return a.first < b.first; });
  std::vector<AlertRecord> records;
  records.reserve(found.size());
  for (auto& [number, record] : found) records.push_back(std::move(record));
  return records;
}

std::optional<std::string> answerAlert(const std::string& directory, std::string_view id,
                                       std::string_view button, const std::optional<std::string>& text) {
  const auto record = readAlert(directory, id);
  if (!record) return "There is no alert " + shown(id) + ".";
  if (const std::string reason = refusal(*record); !reason.empty()) return reason;
  const auto code = alertButtonCode(button);
  if (!code || !alertHasButton(record->alert, *code)) {
    return "Alert " + record->id + " has no button \"" + shown(button) + "\".";
  }
  if (text && !record->alert.textField) return "Alert " + record->id + " has no text field.";
  const std::string content = alertAnswerText({*code, text});
  if (content.size() > kLargestAlertAnswer) {
    return "The text is too long: an answer has at most " + std::to_string(kLargestAlertAnswer) + " bytes.";
  }
  const std::string path = directory + "/" + record->id + std::string(kAlertAnswerEnding);
  const std::error_code error = placeWholeFile(path, content, ExistingFile::stays);
  if (error == std::errc::file_exists) return "Alert " + record->id + " has been answered a moment ago.";
  if (error) return path + " cannot be written: " + error.message() + ".";
  return std::nullopt;
}

}  // namespace zal
