#include "platform/linux/ping/program_output.h"

#include <algorithm>
#include <charconv>

namespace zal {
namespace {

/// Takes a number from the front of the text.
std::optional<std::uint64_t> takeNumber(std::string_view& text) {
  std::uint64_t value = 0;
  const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
  if (result.ec != std::errc{}) return std::nullopt;
  text.remove_prefix(static_cast<std::size_t>(result.ptr - text.data()));
  return value;
}

std::optional<ProgramSummary> summaryIn(std::string_view line) {
  constexpr std::string_view kTransmitted = " packets transmitted, ";
  std::string_view rest = line;
  const auto transmitted = takeNumber(rest);
  if (!transmitted || !rest.starts_with(kTransmitted)) return std::nullopt;
  rest.remove_prefix(kTransmitted.size());
  const auto received = takeNumber(rest);
  if (!received || !(rest.starts_with(" received") || rest.starts_with(" packets received"))) {
    return std::nullopt;
  }
  return ProgramSummary{std::string(line), *transmitted, *received};
}

/// Takes a line from the front of the text.
std::string_view takeLine(std::string_view& text) {
  const std::size_t end = std::min(text.find('\n'), text.size());
  const std::string_view line = text.substr(0, end);
  text.remove_prefix(std::min(end + 1, text.size()));
  return line;
}

}  // namespace

std::optional<ProgramSummary> parseProgramOutput(std::string_view output) {
  std::optional<ProgramSummary> found;
  while (!output.empty()) {
    if (auto summary = summaryIn(takeLine(output))) found = std::move(summary);
  }
  return found;
}

std::string lastLine(std::string_view output) {
  std::string_view last;
  while (!output.empty()) {
    const std::string_view line = takeLine(output);
    if (line.find_first_not_of(" \t\r") != std::string_view::npos) last = line;
  }
  return std::string(last);
}

}  // namespace zal
