#include "session/text_arena.h"

#include <algorithm>
#include <cstring>
#include <functional>

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
    _chunks.push_back({std::unique_ptr<char[]>(new char[size]), size});
    _free = _chunks.back().bytes.get();
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

void TextArena::releaseBefore(std::string_view text) {
  const auto holds = [text](const Chunk& chunk) {
    const std::less_equal<> isUpTo;
    return isUpTo(chunk.bytes.get(), text.data()) && !isUpTo(chunk.bytes.get() + chunk.size, text.data());
  };
  while (!_chunks.empty() && !holds(_chunks.front())) _chunks.pop_front();
}

}  // namespace zal
