#include "session/quality_log_list.h"

#include <utility>

namespace zal {

void QualityLogList::append(std::string_view text) { _lines.push_back(_keep(text)); }

void QualityLogList::insertAtFront(std::string_view text) { _front.push_back(_keep(text)); }

LogLines QualityLogList::copy() const {
  LogLines copy;
  copy.texts = _texts;
  copy.lines.reserve(count());
  copy.lines.insert(copy.lines.end(), _front.rbegin(), _front.rend());
  copy.lines.insert(copy.lines.end(), _lines.begin(), _lines.end());
  return copy;
}

LinePart QualityLogList::takeLines() {
  LinePart taken;
  taken.lines.reserve(_lines.size());
  for (const std::string_view line : _lines) taken.lines.push_back({line, static_cast<double>(_taken++)});
  _lines = {};
  taken.texts = std::exchange(_texts, nullptr);
  for (std::string_view& line : _front) line = _keep(line);
  return taken;
}

LogLines QualityLogList::frontLines() const {
  return {std::vector<std::string_view>(_front.rbegin(), _front.rend()), _texts};
}

void QualityLogList::removeAllObjects() { *this = QualityLogList(); }

std::string_view QualityLogList::_keep(std::string_view text) {
  if (!_texts) _texts = std::make_shared<TextArena>();
  return _texts->keep(text);
}

}  // namespace zal
