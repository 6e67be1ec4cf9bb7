#include "platform/linux/blackbox/record_window.h"

#include <algorithm>
#include <utility>

namespace zal {

RecordWindow::RecordWindow(std::uint64_t size, std::size_t width, Fill fill)
    : _size(size), _width(std::max<std::size_t>(width, 1)), _fill(std::move(fill)) {}

std::string_view RecordWindow::from(std::uint64_t offset, std::size_t atLeast) {
  const std::uint64_t left = _size - std::min(offset, _size);
  const std::uint64_t wanted = std::min<std::uint64_t>(atLeast, left);
  const bool isWithin = offset >= _begin && offset - _begin <= _buffer.size();
  if (isWithin && wanted <= _buffer.size() - (offset - _begin)) {
    return std::string_view(_buffer).substr(offset - _begin);
  }
  const auto width = static_cast<std::size_t>(std::min(std::max<std::uint64_t>(wanted, _width), left));
  _buffer.erase(0, isWithin ? offset - _begin : _buffer.size());
  _begin = offset;
  const std::size_t kept = _buffer.size();
  if (_buffer.capacity() > std::max(2 * _width, width)) {
    // What a long piece took is given back behind it.
    _buffer.resize(kept);
    _buffer.shrink_to_fit();
  }
  _buffer.resize(width);
  _fill(offset + kept, _buffer.data() + kept, width - kept);
  return _buffer;
}

std::uint64_t RecordWindow::find(std::string_view text, std::uint64_t offset) {
  while (offset + text.size() <= _size) {
    const std::string_view bytes = from(offset, text.size());
    const std::size_t at = bytes.find(text);
    if (at != std::string_view::npos) return offset + at;
    offset += bytes.size() - (text.size() - 1);
  }
  return _size;
}

std::uint64_t RecordWindow::endOfContent(std::uint64_t offset) {
  for (std::uint64_t end = _size; end > offset;) {
    const std::uint64_t begin = end - std::min<std::uint64_t>(end - offset, _width);
    const std::string_view bytes = from(begin, static_cast<std::size_t>(end - begin)).substr(0, end - begin);
    const std::size_t last = bytes.find_last_not_of('\0');
    if (last != std::string_view::npos) return begin + last + 1;
    end = begin;
  }
  return offset;
}

}  // namespace zal
