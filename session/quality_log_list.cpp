#include "session/quality_log_list.h"

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

void QualityLogList::removeAllObjects() { *this = QualityLogList(); }

std::string_view QualityLogList::_keep(std::string_view text) {
  if (!_texts) _texts = std::make_shared<TextArena>();
  return _texts->keep(text);
}

}  // namespace zal
