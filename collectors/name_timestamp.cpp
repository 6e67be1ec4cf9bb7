#include "collectors/name_timestamp.h"

#include <stdexcept>

namespace zal {
namespace {

/// The field that a letter of a form stands for; null for a character that stands for itself.
int LocalTime::*fieldOf(char letter) {
  switch (letter) {
    case 'y':
      return &LocalTime::year;
    case 'M':
      return &LocalTime::month;
    case 'd':
      return &LocalTime::day;
    case 'H':
      return &LocalTime::hour;
    case 'm':
      return &LocalTime::minute;
    case 's':
      return &LocalTime::second;
    default:
      return nullptr;
  }
}

}  // namespace

std::optional<WallTime> parseTimestamp(std::string_view text, std::string_view form, const Clock& clock) {
  if (text.size() != form.size()) return std::nullopt;
  LocalTime time{.year = 0, .month = 0, .day = 0};
  for (std::size_t i = 0; i < form.size(); ++i) {
    const auto field = fieldOf(form[i]);
    if (field == nullptr) {
      if (text[i] != form[i]) return std::nullopt;
    } else {
      if (text[i] < '0' || text[i] > '9') return std::nullopt;
      time.*field = time.*field * 10 + (text[i] - '0');
    }
  }
  return clock.momentOf(time);
}

std::string timestampText(WallTime moment, std::string_view form, const Clock& clock) {
  LocalTime time = clock.localTime(moment);
  std::string text(form);
  // From the end, so that each letter takes the last digit that is left of its field.
  for (std::size_t i = form.size(); i-- > 0;) {
    const auto field = fieldOf(form[i]);
    if (field == nullptr) continue;
    text[i] = static_cast<char>('0' + time.*field % 10);
    time.*field /= 10;
  }
  return text;
}

std::optional<WallTime> timestampAt(std::string_view name, std::size_t position, std::string_view form,
                                    const Clock& clock) {
  if (name.size() < position + form.size()) {
    throw std::out_of_range("no room for a timestamp at position " + std::to_string(position) + " of \"" +
                            std::string(name) + "\"");
  }
  return parseTimestamp(name.substr(position, form.size()), form, clock);
}

}  // namespace zal
