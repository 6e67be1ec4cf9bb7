#include "session/sorted_log_list.h"

#include <algorithm>
#include <cmath>
#include <utility>

#include "session/arrival_order.h"

namespace zal {

void _ZalLoggingAgentSessionSortedLogList::addLog(std::string_view text, double time) {
  // What is no number lands in front of the list, that is in front of the least time so far; of later
  // arrivals exactly those that are not greater than that least time go in front of it. So it behaves
  // in every respect as an entry of that least time (or of infinity while there is no real time).
  if (std::isnan(time)) {
    time = _leastTime;
  } else {
    _leastTime = std::min(_leastTime, time);
  }
  _sortedLogList.push_back({_keep(text), time});
}

void _ZalLoggingAgentSessionSortedLogList::prependLog(std::string_view text) {
  _prependedLogs.push_back(_keep(text));
}

LogLines _ZalLoggingAgentSessionSortedLogList::copySortedLogList() const {
  LogLines copy;
  copy.texts = _texts;
  copy.lines = _prependedLogs;
  appendInTimeOrder(_sortedLogList, copy.lines);
  return copy;
}

LinePart _ZalLoggingAgentSessionSortedLogList::takeLines() {
  LinePart taken{std::exchange(_sortedLogList, {}), std::exchange(_texts, nullptr)};
  for (std::string_view& line : _prependedLogs) line = _keep(line);
  return taken;
}

void _ZalLoggingAgentSessionSortedLogList::removeAllObjects() {
  *this = _ZalLoggingAgentSessionSortedLogList();
}

std::string_view _ZalLoggingAgentSessionSortedLogList::_keep(std::string_view text) {
  if (!_texts) _texts = std::make_shared<TextArena>();
  return _texts->keep(text);
}

}  // namespace zal
