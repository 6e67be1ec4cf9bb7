#pragma once

#include <cstddef>
#include <memory>

#include "platform/configuration.h"

namespace zal {

/// What one file is cut into: compressed apart from each other, so that several threads can work on one
/// file and memory does not grow with it.
inline constexpr std::size_t kChunkSize = std::size_t{1} << 20U;

/// Turns chunks of a file into pieces of one raw deflate stream. Each piece but the last ends on a whole
/// byte and lets another follow; none refers to what came before it. Not for several threads.
class ChunkCompressor {
 public:
  virtual ~ChunkCompressor() = default;
  /// At most kChunkSize bytes. Returned: the bytes put out, 0 when they would not fit into `capacity`.
  [[nodiscard]] virtual std::size_t compress(const char* chunk, std::size_t size, bool last, char* output,
                                             std::size_t capacity) = 0;
};

/// Throws std::bad_alloc.
[[nodiscard]] std::unique_ptr<ChunkCompressor> makeChunkCompressor(ArchiveCompression compression);

/// Whether trying it on a few places shows that compressing would win next to nothing.
class CompressionTrial {
 public:
  CompressionTrial();
  ~CompressionTrial();
  CompressionTrial(const CompressionTrial&) = delete;
  CompressionTrial& operator=(const CompressionTrial&) = delete;
  /// How much of a place is looked at.
  static constexpr std::size_t kSample = 8U << 10U;
  /// At most kSample bytes.
  [[nodiscard]] bool shrinks(const char* sample, std::size_t size);
  /// A whole chunk, tried in two places; a short one is always worth compressing.
  [[nodiscard]] bool chunkShrinks(const char* chunk, std::size_t size);

 private:
  struct Workspace;
  std::unique_ptr<Workspace> _workspace;
};

/// The chunk as deflate blocks that hold it as it is. `output` has room for storedSize(size).
std::size_t storeChunk(const char* chunk, std::size_t size, bool last, char* output);
[[nodiscard]] constexpr std::size_t storedSize(std::size_t size) { return size + 5 * (size / 65535 + 1); }

}  // namespace zal
