#include "platform/linux/progress/progress_record.h"

#include <algorithm>
#include <charconv>
#include <cstdint>

#include "platform/linux/files/escaped_text.h"
#include "platform/linux/files/unix_milliseconds.h"

namespace zal {
namespace {

constexpr std::size_t kMostSteps = 10'000;
constexpr std::size_t kLongestLineText = 4096;

/// Takes one blank-separated word off the line.
std::string_view takeWord(std::string_view& line) {
  const std::size_t end = std::min(line.find(' '), line.size());
  const std::string_view word = line.substr(0, end);
  line.remove_prefix(std::min(end + 1, line.size()));
  return word;
}

template <class Number>
std::optional<Number> numberOf(std::string_view word) {
  Number number = 0;
  const auto [end, error] = std::from_chars(word.data(), word.data() + word.size(), number);
  if (error != std::errc{} || end != word.data() + word.size()) return std::nullopt;
  return number;
}

std::optional<WallTime> momentOf(std::string_view word) {
  const auto milliseconds = numberOf<std::int64_t>(word);
  return milliseconds ? momentOfUnixMilliseconds(*milliseconds) : std::nullopt;
}

/// The number of a step of this record.
std::optional<std::size_t> stepOf(std::string_view word, const DumpProgressRecord& record) {
  const auto number = numberOf<std::size_t>(word);
  if (!number || *number == 0 || *number > record.steps.size()) return std::nullopt;
  return number;
}

std::optional<DumpProgressRecord> parseBegin(std::string_view line) {
  if (takeWord(line) != "BEGIN") return std::nullopt;
  const auto began = momentOf(takeWord(line));
  if (!began) return std::nullopt;
  DumpProgressRecord record;
  record.began = *began;
  while (!line.empty()) {
    const std::string_view word = takeWord(line);
    const std::size_t equals = std::min(word.find('='), word.size());
    const std::string_view key = word.substr(0, equals);
    const std::string_view value = word.substr(std::min(equals + 1, word.size()));
    if (key == "pid") record.agent.processId = numberOf<pid_t>(value).value_or(0);
    if (key == "start") record.agent.startTime = numberOf<std::uint64_t>(value).value_or(0);
    if (key == "steps") record.steps.resize(std::min(numberOf<std::size_t>(value).value_or(0), kMostSteps));
    if (key == "service") record.service = unescaped(value);
    if (key == "directory") record.directory = unescaped(value);
  }
  return record;
}

void endWith(DumpProgressRecord& record, DumpProgressRecord::State state, std::string_view& line) {
  record.state = state;
  record.ended = momentOf(takeWord(line));
}

void readLine(DumpProgressRecord& record, std::string_view line) {
  using State = DumpProgressRecord::State;
  if (record.state != State::running) return;  // the first end counts
  const std::string_view word = takeWord(line);
  if (word == "PLAN") {
    if (const auto number = stepOf(takeWord(line), record)) record.steps[*number - 1].name = unescaped(line);
  } else if (word == "STEP") {
    const auto number = stepOf(takeWord(line), record);
    if (!number) return;
    record.currentStep = *number;
    record.steps[*number - 1].began = momentOf(takeWord(line));
  } else if (word == "MISSING") {
    const std::size_t tab = std::min(line.find('\t'), line.size());
    record.missing.push_back(
        {unescaped(line.substr(0, tab)), unescaped(line.substr(std::min(tab + 1, line.size())))});
  } else if (word == "OK") {
    endWith(record, State::done, line);
    record.archivePath = unescaped(line);
  } else if (word == "FAILED") {
    endWith(record, State::failed, line);
    record.reason = unescaped(line);
  } else if (word == "CUT") {
    endWith(record, State::cutOff, line);
  }
}

std::string momentText(WallTime moment) { return std::to_string(unixMilliseconds(moment)); }
std::string lineText(std::string_view text) { return escapedLine(cutAtCharacter(text, kLongestLineText)); }

}  // namespace

std::optional<DumpProgressRecord> parseDumpProgress(std::string_view text) {
  std::optional<DumpProgressRecord> record;
  for (std::size_t end = text.find('\n'); end != std::string_view::npos; end = text.find('\n')) {
    const std::string_view line = text.substr(0, end);
    text.remove_prefix(end + 1);
    if (record) {
      readLine(*record, line);
    } else {
      record = parseBegin(line);
      if (!record) return std::nullopt;
    }
  }
  return record;
}

std::string progressBeginText(std::string_view service, std::string_view directory,
                              const std::vector<std::string>& steps, WallTime now,
                              const ProcessIdentity& agent) {
  std::string text = "BEGIN " + momentText(now) + " pid=" + std::to_string(agent.processId) +
                     " start=" + std::to_string(agent.startTime) + " steps=" + std::to_string(steps.size()) +
                     " service=" + escapedWord(cutAtCharacter(service, kLongestLineText)) +
                     " directory=" + escapedWord(cutAtCharacter(directory, kLongestLineText)) + "\n";
  for (std::size_t i = 0; i < steps.size(); ++i) {
    text += "PLAN " + std::to_string(i + 1) + " " + lineText(steps[i]) + "\n";
  }
  return text;
}

std::string progressStepText(std::size_t number, WallTime now) {
  return "STEP " + std::to_string(number) + " " + momentText(now) + "\n";
}

std::string progressMissingText(std::string_view what, std::string_view why) {
  return "MISSING " + lineText(what) + "\t" + lineText(why) + "\n";
}

std::string progressDoneText(std::string_view archivePath, WallTime now) {
  return "OK " + momentText(now) + " " + lineText(archivePath) + "\n";
}

std::string progressFailedText(std::string_view reason, WallTime now) {
  return "FAILED " + momentText(now) + " " + lineText(reason) + "\n";
}

std::string progressCutOffText(WallTime now) { return "CUT " + momentText(now) + "\n"; }

}  // namespace zal
