#include "dump/manifest.h"

#include <array>
#include <cstdio>
#include <vector>

#include "platform/json_text.h"

namespace zal {
namespace {

constexpr std::int64_t kFormat = 1;

/// "2026-11-21T18:49:20.123Z"
std::string utcText(WallTime moment) {
  const auto day = std::chrono::floor<std::chrono::days>(moment);
  const std::chrono::year_month_day date(day);
  const std::chrono::hh_mm_ss time(std::chrono::floor<std::chrono::milliseconds>(moment - day));
  std::array<char, 64> text{};
  std::snprintf(text.data(), text.size(), "%04d-%02u-%02uT%02d:%02d:%02d.%03dZ",
                static_cast<int>(date.year()), static_cast<unsigned>(date.month()),
                static_cast<unsigned>(date.day()), static_cast<int>(time.hours().count()),
                static_cast<int>(time.minutes().count()), static_cast<int>(time.seconds().count()),
                static_cast<int>(time.subseconds().count()));
  return text.data();
}

std::string hexText(CollectionFlags flags) {
  std::array<char, 16> text{};
  std::snprintf(text.data(), text.size(), "0x%x", flags);
  return text.data();
}

std::string rowsText(const std::vector<std::string>& rows) {
  std::string text = "[";
  for (const std::string& row : rows) text.append(text.size() > 1 ? ",\n    " : "\n    ").append(row);
  return text + (rows.empty() ? "]" : "\n  ]");
}

template <class Part, class ToRow>
std::string rowsOf(const std::vector<Part>& parts, ToRow toRow) {
  std::vector<std::string> rows;
  rows.reserve(parts.size());
  for (const Part& part : parts) rows.push_back(toRow(part));
  return rowsText(rows);
}

std::string stepRow(const CollectionAccount::Step& step) {
  JsonObject row;
  row.add("step", step.name).add("state", partStateText(step.state));
  if (step.began) {
    row.add("began", utcText(*step.began));
    row.add("milliseconds", static_cast<std::int64_t>(step.duration.count()));
  }
  if (!step.why.empty()) {
    std::vector<std::string> reasons;
    for (const std::string& why : step.why) reasons.push_back(jsonString(why));
    row.addJson("why", jsonArray(reasons));
  }
  return row.text();
}

void addStep(JsonObject& row, const CollectionAccount& account, std::size_t step) {
  if (step < account.steps.size()) row.add("step", account.steps[step].name);
}

std::string sourceRow(const CollectionAccount& account, const CollectionAccount::Source& source) {
  JsonObject row;
  row.add("source", source.path).add("state", partStateText(source.state));
  addStep(row, account, source.step);
  row.add("directory", source.directory);
  if (!source.why.empty()) row.add("why", source.why);
  return row.text();
}

std::string commandRow(const CollectionAccount& account, const CollectionAccount::Command& command) {
  JsonObject row;
  if (!command.line.empty()) row.add("command", command.line);
  row.add("state", partStateText(command.state));
  addStep(row, account, command.step);
  row.add("file", command.file);
  if (!command.line.empty()) row.add("began", utcText(command.began));
  if (command.exitStatus) row.add("exitStatus", static_cast<std::int64_t>(*command.exitStatus));
  if (!command.why.empty()) row.add("why", command.why);
  return row.text();
}

std::string fileRow(const ArchivedFile& file) {
  JsonObject row;
  row.add("file", file.name).add("bytes", file.bytes).add("sha256", file.sha256);
  if (file.isCut) row.add("cut", true);
  return row.text();
}

}  // namespace

std::string_view partStateText(PartState state) {
  switch (state) {
    case PartState::notRun:
      return "not run";
    case PartState::running:
      return "running";
    case PartState::done:
      return "done";
    case PartState::partial:
      return "partial";
    case PartState::missing:
      return "missing";
    case PartState::failed:
      return "failed";
    case PartState::skipped:
      return "skipped";
  }
  return "";
}

std::string manifestText(const CollectionAccount& account, const ArchiveContent& content, WallTime archived) {
  std::string text = "{";
  const auto add = [&](std::string_view key, const std::string& json) {
    text.append(text.size() > 1 ? ",\n  " : "\n  ").append(jsonString(key)).append(": ").append(json);
  };
  add("manifest", std::to_string(kFormat));
  add("service", jsonString(account.service));
  add("directory", jsonString(account.directory));
  add("flags", jsonString(hexText(account.flags)));
  add("began", jsonString(utcText(account.began)));
  add("archived", jsonString(utcText(archived)));
  if (account.isFinishedLater) add("finishedLater", "true");
  add("steps", rowsOf(account.steps, stepRow));
  add("commands",
      rowsOf(account.commands, [&](const auto& command) { return commandRow(account, command); }));
  add("sources", rowsOf(account.sources, [&](const auto& source) { return sourceRow(account, source); }));
  if (account.rowsLeftOut > 0) add("rowsLeftOut", std::to_string(account.rowsLeftOut));
  add("files", rowsOf(content.files, fileRow));
  add("remarks", rowsOf(content.remarks, [](const std::string& remark) { return jsonString(remark); }));
  return text + "\n}\n";
}

}  // namespace zal
