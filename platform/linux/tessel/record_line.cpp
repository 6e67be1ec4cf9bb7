#include "platform/linux/tessel/record_line.h"

#include <array>
#include <cstdio>

#include "platform/linux/log/record_text.h"

namespace zal::tessel {

std::string timeText(WallTime time, const Clock& clock) {
  constexpr std::array kMonths = {"Jan", "Feb", "Mar", "Apr", "May", "Jun",
                                  "Jul", "Aug", "Sep", "Oct", "Nov", "Dec"};
  const LocalTime local = clock.localTime(time);
  char text[64];
  std::snprintf(text, sizeof text, "%s %2d %02d:%02d:%02d.%03d",
                kMonths.at(static_cast<std::size_t>(local.month - 1)), local.day, local.hour, local.minute,
                local.second, local.millisecond);
  return text;
}

std::string recordLine(const Record& record, const Clock& clock) {
  std::string line = timeText(record.time, clock) + ' ';
  appendOneLine(line, record.host);
  line += ' ';
  appendOneLine(line, record.name);
  if (!record.process.empty()) {
    line += '[';
    appendOneLine(line, record.process);
    line += ']';
  }
  line += ": ";
  std::string_view text = record.text;
  while (text.ends_with('\n')) text.remove_suffix(1);
  appendMarkedText(line, text);
  return line + '\n';
}

}  // namespace zal::tessel
