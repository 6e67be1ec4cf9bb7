#include "platform/main_thread_watch.h"

#include <utility>

namespace zal {

MainThreadWatch::MainThreadWatch(const Clock& clock, std::chrono::milliseconds limit, Report report)
    : _clock(clock), _limit(limit), _report(std::move(report)) {
  _watch = this;
}

MainThreadWatch::~MainThreadWatch() { _watch = nullptr; }

void MainThreadWatch::Span::_begin(std::string_view kind, std::string_view name) {
  _isWatched = true;
  _kind = kind;
  _name = name;
  _began = _watch->_clock.steadyNow();
  _toldInside = {};
  _outer = std::exchange(_watch->_innermost, this);
}

void MainThreadWatch::Span::_end() {
  if (_watch == nullptr) return;  // it ended inside
  _watch->_innermost = _outer;
  const std::chrono::nanoseconds all = _watch->_clock.steadyNow() - _began;
  const std::chrono::nanoseconds own = all - _toldInside;
  const bool isTold = own > _watch->_limit;
  if (isTold && !_isWanted) {
    _watch->_report(_kind, _name, std::chrono::floor<std::chrono::milliseconds>(own));
  }
  if (_outer != nullptr) _outer->_toldInside += isTold ? all : _toldInside;
}

}  // namespace zal
