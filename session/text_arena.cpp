#include "session/text_arena.h"

#include <algorithm>
#include <cstring>

namespace zal {

namespace {
constexpr std::size_t kLargestChunk = 256U * 1024U;
}  // namespace

std::string_view TextArena::keep(std::string_view text) {
  if (text.empty()) return {};
  if (text.size() > _left) {
    // Doubling up to a limit: a short session stays small, a long one allocates seldom.
    const std::size_t size = std::max(_nextChunk, text.size());
    _chunks.push_back(std::unique_ptr<char[]>(new char[size]));
    _free = _chunks.back().get();
    _left = size;
    _nextChunk = std::min(_nextChunk * 2, kLargestChunk);
  }
  char* const kept = _free;
  std::memcpy(kept, text.data(), text.size());
  _free += text.size();
  _left -= text.size();
  return {kept, text.size()};
}

}  // namespace zal
