#include "platform/linux/tessel/line_splitter.h"

#include <algorithm>

namespace zal::tessel {

void LineSplitter::add(std::string_view bytes) {
  _buffer.erase(0, _start);
  _scanned -= _start;
  _start = 0;
  _buffer.append(bytes);
}

std::optional<std::string_view> LineSplitter::next() {
  for (;;) {
    const std::size_t lineEnd = _buffer.find('\n', _scanned);
    const bool tooLong = std::min(lineEnd, _buffer.size()) - _start > kLongestLine;
    if (lineEnd == std::string::npos && !tooLong) {
      _scanned = _buffer.size();
      return std::nullopt;
    }
    const std::size_t size = tooLong ? kLongestLine : lineEnd - _start;
    const std::string_view line = std::string_view(_buffer).substr(_start, size);
    _start += size + (tooLong ? 0 : 1);
    _scanned = _start;
    if (!_skips) return line;
    _skips = tooLong;
  }
}

std::string LineSplitter::takeRest() {
  std::string rest = _skips ? std::string() : _buffer.substr(_start);
  _buffer.clear();
  _start = _scanned = 0;
  return rest;
}

}  // namespace zal::tessel
