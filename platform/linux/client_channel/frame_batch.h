#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace zal {

/// Whole frames, one after another, and how far they have been written. Not for several threads.
class FrameBatch {
 public:
  /// A request counts as one; a barrier does not.
  void append(std::string_view frame, bool isRequest);
  void advance(std::size_t bytes) { _written += bytes; }
  /// Forgets all; the memory is kept for the next frames.
  void clear();
  /// Gives back what a burst made large. Only while empty.
  void trim();
  void swap(FrameBatch& other);

  [[nodiscard]] bool isEmpty() const { return _bytes.empty(); }
  [[nodiscard]] std::string_view unwritten() const { return std::string_view(_bytes).substr(_written); }

  struct Count {
    std::uint64_t frames = 0;
    std::uint64_t requests = 0;
  };
  [[nodiscard]] Count count() const { return _count; }
  /// After the connection broke: forgets the frames that were written whole, and takes the torn one
  /// back to its beginning. Returned: what was forgotten.
  Count forgetWritten();

 private:
  std::string _bytes;
  std::size_t _written = 0;
  Count _count;
};

}  // namespace zal
