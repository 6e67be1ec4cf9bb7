#pragma once

#include <cstddef>
#include <memory>

namespace zal {

/// What letAnotherFollow may add to a stream.
inline constexpr std::size_t kContinuationRoom = 5;

/// Makes a finished raw deflate stream one that another can be written behind. Which bit says that a
/// block is the last is known only to whoever decodes the blocks before it, so that is done, with a
/// decoder that stops between blocks. Not for several threads.
class DeflateContinuation {
 public:
  /// Throws std::bad_alloc.
  DeflateContinuation();
  ~DeflateContinuation();
  DeflateContinuation(const DeflateContinuation&) = delete;
  DeflateContinuation& operator=(const DeflateContinuation&) = delete;

  /// `stream` holds `size` bytes and has room for kContinuationRoom more; `content` is how long it is
  /// unpacked. Returned: its size now, on a whole byte; 0 when it is no whole stream of that content.
  [[nodiscard]] std::size_t letAnotherFollow(char* stream, std::size_t size, std::size_t content);

 private:
  struct Decoder;
  std::unique_ptr<Decoder> _decoder;
};

}  // namespace zal
