#include "session/session_lines.h"

#include <initializer_list>

namespace zal {

namespace {

constexpr std::string_view kNoLineSender = "(No sender)";
constexpr std::string_view kNoCheckpoint = "(No checkpoint provided)";
constexpr std::string_view kNoLog = "** No Log Provided **";

std::string join(std::initializer_list<std::string_view> parts) {
  std::size_t size = 0;
  for (const std::string_view part : parts) size += part.size();
  std::string text;
  text.reserve(size);
  for (const std::string_view part : parts) text += part;
  return text;
}

std::string entryLine(std::string_view sender, std::string_view text, std::string_view timeText) {
  return join({"[Sender: ", sender, "] ", text, "   [", timeText, "]"});
}

}  // namespace

std::string beginLine(std::string_view sender, std::string_view timeText) {
  return join({"[Sender: ", sender, "] Begin Session  [", timeText, "]"});
}

std::string endLine(std::string_view sender, std::string_view timeText) {
  return join({"[Sender: ", sender, "] End Session  [", timeText, "]"});
}

std::string checkpointLine(OptionalText checkpoint, OptionalText sender, std::string_view timeText) {
  return entryLine(textOr(sender, kNoLineSender), textOr(checkpoint, kNoCheckpoint), timeText);
}

std::string descriptionLine(OptionalText description, OptionalText log, std::string_view sender,
                            std::string_view timeText) {
  if (isEmptyText(description)) return entryLine(sender, textOr(log, kNoLog), timeText);
  if (isEmptyText(log)) return entryLine(sender, *description, timeText);
  return metricLine(*description, *log, sender, timeText);
}

std::string metricLine(std::string_view name, std::string_view value, std::string_view sender,
                       std::string_view timeText) {
  return join({"[Sender: ", sender, "] ", name, ": ", value, "   [", timeText, "]"});
}

std::optional<std::string> headerLine(OptionalText label, OptionalText value) {
  if (isEmptyText(label) || isEmptyText(value)) return std::nullopt;
  return join({"[", *label, ": ", *value, "]"});
}

std::string echoOf(std::string_view line) { return join({"=== ", line}); }

}  // namespace zal
