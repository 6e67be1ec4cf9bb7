#pragma once

#include <condition_variable>
#include <cstdint>
#include <mutex>
#include <string>

#include "platform/linux/archive/sha256.h"

namespace zal {

/// The SHA-256 of one file whose chunks are read by several threads: each adds its own, in their order.
/// A chunk that comes short ends the file, as it does in the archive.
class FileHash {
 public:
  /// Whether a chunk can be added without waiting.
  [[nodiscard]] bool isTurn(std::uint64_t offset);
  /// Waits for the chunks before it: whoever has one adds it. `asked` bytes were wanted, `size` came.
  void add(std::uint64_t offset, const char* bytes, std::size_t size, std::size_t asked);
  /// When all are added.
  [[nodiscard]] std::string takeDigest();

 private:
  std::mutex _mutex;
  std::condition_variable _turned;
  // Guarded by _mutex; the hash belongs to whoever's turn it is.
  std::uint64_t _next = 0;
  bool _ended = false;
  Sha256 _hash;
};

}  // namespace zal
