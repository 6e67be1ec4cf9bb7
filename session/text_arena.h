#pragma once

#include <cstddef>
#include <deque>
#include <memory>
#include <string_view>

namespace zal {

/// Keeps texts for as long as it lives, in few large pieces: a session can hold a million lines, and
/// an allocation for each would cost more than the lines. One thread at a time.
class TextArena {
 public:
  /// A copy of the text that stays where it is. A newline, not part of the result, follows it in
  /// memory, and mostly the next text follows that: lines in order of arrival are one stretch of bytes.
  [[nodiscard]] std::string_view keep(std::string_view text);

  /// Frees what only texts before this one, which is one of its own, needed.
  void releaseBefore(std::string_view text);

  /// Whether no text had a character beyond ASCII. Asked for each text on arrival, when it is at hand
  /// anyway, so that nobody needs to go through a million lines for it later.
  [[nodiscard]] bool isAscii() const { return _isAscii; }

 private:
  struct Chunk {
    std::unique_ptr<char[]> bytes;
    std::size_t size;
  };
  std::deque<Chunk> _chunks;
  char* _free = nullptr;
  std::size_t _left = 0;
  std::size_t _nextChunk = 4096;
  bool _isAscii = true;
};

}  // namespace zal
