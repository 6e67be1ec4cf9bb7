#include "session/entry_time_text.h"

#include "session/date_text.h"

namespace zal {

std::string_view EntryTimeText::text(WallTime moment) {
  const auto second = std::chrono::floor<std::chrono::seconds>(moment);
  if (_second != second) {
    _text = entryDateText(_clock.localTime(second));
    _text.append(" (").append(_timeZone.abbreviation(_clock)).append(")");
    _second = second;
  }
  const auto part = std::chrono::floor<std::chrono::milliseconds>(moment - second);
  setEntryMilliseconds(_text, static_cast<int>(part.count()));
  return _text;
}

}  // namespace zal
