#include "platform/linux/stackshot/arguments.h"

#include <charconv>
#include <limits>

namespace zal::stackshot {
namespace {

/// A whole number, decimal or with "0x" hexadecimal.
std::optional<std::uint64_t> number(std::string_view text) {
  int base = 10;
  if (text.starts_with("0x") || text.starts_with("0X")) {
    text.remove_prefix(2);
    base = 16;
  }
  std::uint64_t value = 0;
  const char* const end = text.data() + text.size();
  const auto result = std::from_chars(text.data(), end, value, base);
  if (text.empty() || result.ec != std::errc{} || result.ptr != end) return std::nullopt;
  return value;
}

std::optional<std::uint64_t> numberUpTo(std::string_view text, std::uint64_t least, std::uint64_t most) {
  const auto value = number(text);
  return value && *value >= least && *value <= most ? value : std::nullopt;
}

/// One option with its value. Returned: whether the value fits.
struct Option {
  std::string_view name;
  bool (*take)(Arguments& arguments, const std::string& value);
};

constexpr Option kOptions[] = {
    {"--pid",
     [](Arguments& arguments, const std::string& value) {
       if (const auto id = numberUpTo(value, 1, std::numeric_limits<pid_t>::max()))
         arguments.process = static_cast<pid_t>(*id);
       return arguments.process.has_value();
     }},
    {"--code",
     [](Arguments& arguments, const std::string& value) {
       if (const auto code = numberUpTo(value, 0, std::numeric_limits<std::uint32_t>::max()))
         arguments.code = static_cast<std::uint32_t>(*code);
       return arguments.code.has_value();
     }},
    {"--limit",
     [](Arguments& arguments, const std::string& value) {
       const auto seconds = numberUpTo(value, 1, 600);
       if (seconds) arguments.limit = std::chrono::seconds(*seconds);
       return seconds.has_value();
     }},
    {"--reason",
     [](Arguments& arguments, const std::string& value) {
       arguments.reason = value;
       return true;
     }},
    {"--message",
     [](Arguments& arguments, const std::string& value) {
       arguments.message = value;
       return true;
     }},
    {"--exception",
     [](Arguments& arguments, const std::string& value) {
       arguments.exception = value;
       return true;
     }},
    {"--output",
     [](Arguments& arguments, const std::string& value) {
       arguments.output = value;
       return !value.empty();
     }},
};

const Option* optionNamed(std::string_view name) {
  for (const Option& option : kOptions) {
    if (option.name == name) return &option;
  }
  return nullptr;
}

std::string whatIsMissing(const Arguments& arguments) {
  if (arguments.output.empty()) return "--output is missing";
  if (!arguments.process && (arguments.message || arguments.exception))
    return "--message and --exception need --pid";
  if (arguments.process && arguments.reason) return "--reason is for the machine, without --pid";
  return "";
}

}  // namespace

std::variant<Arguments, std::string> parseArguments(const std::vector<std::string>& words) {
  Arguments result;
  for (std::size_t at = 0; at < words.size(); at += 2) {
    if (words[at] == "--help") {
      result.help = true;
      return result;
    }
    const Option* const option = optionNamed(words[at]);
    if (option == nullptr) return "\"" + words[at] + "\" is not understood";
    if (at + 1 == words.size()) return words[at] + " needs a value";
    if (!option->take(result, words[at + 1])) return "\"" + words[at + 1] + "\" is nothing for " + words[at];
  }
  const std::string missing = whatIsMissing(result);
  if (!missing.empty()) return missing;
  return result;
}

std::string_view helpText() {
  return R"(Writes the stacks of all threads of the machine, or of one process, as a text.

Usage: lirra-stackshot [--reason TEXT] [--code N] --output PLACE [--limit SECONDS]
       lirra-stackshot --pid PID [--message TEXT | --exception TEXT] [--code N] --output PLACE [--limit SECONDS]

  --pid PID         that process alone, instead of the machine
  --reason TEXT     stands in the report of the machine
  --message TEXT    stands in the report of the process
  --exception TEXT  the exception that the process survived
  --code N          a number for the report, such as 0xFED9E2FF
  --output PLACE    a directory, which gets a file with the time in its name and is made when it ends
                    with a slash; another path is the file; "-" is the standard output
  --limit SECONDS   after that long it writes what it has; 6 unless given
  --help            this text

A thread is stopped only while its own stack is read. SIGTERM ends the program early: everything is let go
and what is known by then is written. The path of the file goes to the standard output.
Exit codes: 0 done, 1 no report was written, 2 wrong usage.
)";
}

}  // namespace zal::stackshot
