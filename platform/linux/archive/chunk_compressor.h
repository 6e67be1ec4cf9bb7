#pragma once

#include <cstddef>
#include <memory>

#include "platform/configuration.h"

namespace zal {

/// What one file is cut into: compressed apart from each other, so that several threads can work on one
/// file and memory does not grow with it.
inline constexpr std::size_t kChunkSize = std::size_t{1} << 20U;

struct Chunk {
  const char* bytes = nullptr;
  std::size_t size = 0;  ///< at most kChunkSize
  bool last = true;      ///< of its file
  double share = 0;      ///< about how much of it compressing leaves; see CompressionTrial
};

/// Turns chunks of a file into pieces of one raw deflate stream. Each piece but the last ends on a whole
/// byte and lets another follow; none refers to what came before it. Not for several threads.
class ChunkCompressor {
 public:
  virtual ~ChunkCompressor() = default;
  /// Returned: the bytes put out, 0 when they would not fit into `capacity`.
  [[nodiscard]] virtual std::size_t compress(const Chunk& chunk, char* output, std::size_t capacity) = 0;
};

/// Throws std::bad_alloc.
[[nodiscard]] std::unique_ptr<ChunkCompressor> makeChunkCompressor(ArchiveCompression compression);

/// Tries on a few places what compressing would win. Not for several threads.
class CompressionTrial {
 public:
  CompressionTrial();
  ~CompressionTrial();
  CompressionTrial(const CompressionTrial&) = delete;
  CompressionTrial& operator=(const CompressionTrial&) = delete;
  /// How much of a place is looked at.
  static constexpr std::size_t kSample = 8U << 10U;
  /// What is above leaves so much that storing it is the better bargain.
  static constexpr double kHardlyShrinks = 31.0 / 32;
  /// How much is left of at most kSample bytes: 0 to 1.
  [[nodiscard]] double share(const char* sample, std::size_t size);
  /// The same of a whole chunk, by two places of it; a short one counts as always worth it: 0.
  [[nodiscard]] double chunkShare(const char* chunk, std::size_t size);

 private:
  struct Workspace;
  std::unique_ptr<Workspace> _workspace;
};

/// The chunk as deflate blocks that hold it as it is. `output` has room for storedSize(size).
std::size_t storeChunk(const char* chunk, std::size_t size, bool last, char* output);
[[nodiscard]] constexpr std::size_t storedSize(std::size_t size) { return size + 5 * (size / 65535 + 1); }

}  // namespace zal
