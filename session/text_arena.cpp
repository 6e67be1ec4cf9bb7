#include "session/text_arena.h"

#include <algorithm>
#include <cstring>

#include "session/text_encoding.h"

namespace zal {

namespace {
constexpr std::size_t kLargestChunk = 1024U * 1024U;
}  // namespace

std::string_view TextArena::keep(std::string_view text) {
  const std::size_t needed = text.size() + 1;
  if (needed > _left) {
    // Doubling up to a limit: a short session stays small, a long one allocates seldom.
    const std::size_t size = std::max(_nextChunk, needed);
    _chunks.push_back(std::unique_ptr<char[]>(new char[size]));
    _free = _chunks.back().get();
    _left = size;
    _nextChunk = std::min(_nextChunk * 2, kLargestChunk);
  }
  _isAscii = _isAscii && zal::isAscii(text);
  char* const kept = _free;
  if (!text.empty()) std::memcpy(kept, text.data(), text.size());
  kept[text.size()] = '\n';
  _free += needed;
  _left -= needed;
  return {kept, text.size()};
}

}  // namespace zal
