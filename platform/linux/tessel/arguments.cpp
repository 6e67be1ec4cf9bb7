#include "platform/linux/tessel/arguments.h"

#include <array>
#include <charconv>
#include <cstddef>

namespace zal::tessel {
namespace {

struct PlaceOption {
  std::string_view name;
  std::optional<std::string> Arguments::*place;
};

constexpr std::array kPlaceOptions = {
    PlaceOption{"--journal-directory", &Arguments::journalDirectory},
    PlaceOption{"--syslog", &Arguments::syslogFile},
    PlaceOption{"--kmsg", &Arguments::kernelLog},
};

const PlaceOption* placeOption(std::string_view word) {
  for (const PlaceOption& option : kPlaceOptions) {
    if (option.name == word) return &option;
  }
  return nullptr;
}

}  // namespace

std::optional<std::chrono::seconds> parseAge(std::string_view text) {
  // Up to nine digits: what is longer would overflow as days, and no log is that old.
  if (text.size() < 3 || text.size() > 11 || text.front() != '-') return std::nullopt;
  std::uint32_t count = 0;
  const char* const unit = &text.back();
  if (text[1] < '0' || text[1] > '9') return std::nullopt;
  const auto [end, error] = std::from_chars(text.data() + 1, unit, count);
  if (error != std::errc() || end != unit) return std::nullopt;
  switch (*unit) {
    case 's':
      return std::chrono::seconds(count);
    case 'm':
      return std::chrono::minutes(count);
    case 'h':
      return std::chrono::hours(count);
    case 'd':
      return std::chrono::hours(24) * count;
    default:
      return std::nullopt;
  }
}

std::variant<Arguments, std::string> parseArguments(const std::vector<std::string>& words) {
  Arguments result;
  const auto wordAt = [&](std::size_t at) {
    return at < words.size() ? std::string_view(words[at]) : std::string_view();
  };
  for (std::size_t at = 0; at < words.size(); ++at) {
    const std::string& word = words[at];
    if (word == "--help") {
      result.help = true;
    } else if (word == "-w") {
      result.follow = true;
    } else if (word == "-k") {
      if (wordAt(at + 1) != "Time" || wordAt(at + 2) != "ge")
        return "-k takes three words, such as \"Time ge -5m\"";
      result.lookBack = parseAge(wordAt(at + 3));
      if (!result.lookBack)
        return "\"" + std::string(wordAt(at + 3)) + "\" is no age such as -30s, -5m, -2h or -1d";
      at += 3;
    } else if (const PlaceOption* const option = placeOption(word)) {
      if (wordAt(at + 1).empty()) return word + " needs a path";
      result.*(option->place) = words[++at];
    } else {
      return "\"" + word + "\" is not understood";
    }
  }
  if (result.follow && result.lookBack) return "-w and -k exclude each other";
  return result;
}

std::string_view helpText() {
  return R"(Prints the host's system log: the journal where there is one, else the syslog file, else the kernel log.

Usage: tessel [-w | -k Time ge -AGE] [--journal-directory DIR] [--syslog FILE] [--kmsg FILE]

  -w                       only messages from now on, until it is killed
  -k Time ge -AGE          messages at most that old: -30s, -5m, -2h, -1d
  --journal-directory DIR  the journal in this directory
  --syslog FILE            this syslog file
  --kmsg FILE              the kernel log that this file gives
                           With any of these three, only the places named are looked at.
  --help                   this text

Each message is written at once, so that nothing of it is lost when the program is killed.
Exit codes: 0 done, 1 there is no log that can be read, or it broke off, 2 wrong usage.
)";
}

}  // namespace zal::tessel
