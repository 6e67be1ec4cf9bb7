#include "platform/linux/archive/chunk_compressor.h"

#include <gtest/gtest.h>
#include <zlib.h>

#include <random>

#include "tests/linux/archive/archive_fixture.h"

namespace zal::testing {
namespace {

std::string inflated(const std::string& stream) {
  z_stream state{};
  ::inflateInit2(&state, -MAX_WBITS);
  std::string content(8U << 20U, '\0');
  state.next_in = reinterpret_cast<unsigned char*>(const_cast<char*>(stream.data()));
  state.avail_in = static_cast<unsigned>(stream.size());
  state.next_out = reinterpret_cast<unsigned char*>(content.data());
  state.avail_out = static_cast<unsigned>(content.size());
  const int result = ::inflate(&state, Z_FINISH);
  content.resize(state.total_out);
  if (result != Z_STREAM_END || state.avail_in > 0) content = "no whole stream";
  ::inflateEnd(&state);
  return content;
}

class ChunkCompressorTest : public ::testing::TestWithParam<ArchiveCompression> {
 protected:
  /// One piece; stored when it does not shrink.
  std::string piece(const std::string& chunk, bool last) {
    std::string output(storedSize(chunk.size()), '\0');
    std::size_t size =
        compressor->compress({chunk.data(), chunk.size(), last, share}, output.data(), chunk.size());
    if (size == 0) size = storeChunk(chunk.data(), chunk.size(), last, output.data());
    output.resize(size);
    return output;
  }
  /// Letters of which the first ones come rather often: the fewer, the more it shrinks.
  std::string letters(std::size_t size, unsigned kinds) {
    std::string text;
    for (std::size_t i = 0; i < size; ++i) text += static_cast<char>('a' + random() % (random() % kinds + 1));
    return text;
  }
  double share = 0;
  std::mt19937 random{20240502};
  const std::unique_ptr<ChunkCompressor> compressor = makeChunkCompressor(GetParam());
};

INSTANTIATE_TEST_SUITE_P(Compression, ChunkCompressorTest,
                         ::testing::Values(ArchiveCompression::small, ArchiveCompression::fast),
                         compressionName);

TEST_P(ChunkCompressorTest, PiecesOfEveryLengthMakeOneStream) {
  std::string content, stream;
  for (const std::size_t size : {1U, 2U, 3U, 10U, 100U, 257U, 258U, 259U, 1000U, 4096U, 32767U, 32768U,
                                 65535U, 65536U, 65537U, 100'000U, 300'000U}) {
    for (const unsigned kinds : {1U, 2U, 5U, 26U, 200U}) {
      const std::string chunk = letters(size, kinds);
      share = kinds > 5 ? 0.9 : 0.1;  // which decides on the effort
      content += chunk;
      stream += piece(chunk, false);
    }
  }
  EXPECT_EQ(inflated(stream + std::string("\x03\x00", 2)), content);
  EXPECT_EQ(inflated(stream + piece("the end", true)), content + "the end");
}

TEST_P(ChunkCompressorTest, EveryEndOfAPieceLetsAnotherFollow) {
  // Lengths one after the other end on every bit of a byte.
  for (std::size_t size = 40; size < 240; ++size) {
    const std::string chunk = letters(size, 4);
    ASSERT_EQ(inflated(piece(chunk, false) + piece(chunk, true)), chunk + chunk) << size;
  }
}

TEST_P(ChunkCompressorTest, WhatDoesNotFitIsRefused) {
  const std::string chunk = letters(50'000, 26);
  std::string output(50'000, '\0');
  EXPECT_GT(compressor->compress({chunk.data(), chunk.size(), true}, output.data(), output.size()), 0U);
  for (const std::size_t capacity : {0U, 1U, 5U, 6U, 100U, 1000U}) {
    EXPECT_EQ(compressor->compress({chunk.data(), chunk.size(), true}, output.data(), capacity), 0U);
    EXPECT_EQ(compressor->compress({chunk.data(), chunk.size(), false}, output.data(), capacity), 0U);
  }
}

TEST(CompressionTrialTest, TellsTextFromWhatIsCompressedAlready) {
  std::mt19937 random{1};
  std::string noise, text;
  for (std::size_t i = 0; i < 100'000; ++i) noise += static_cast<char>(random());
  while (text.size() < 100'000) text += "line " + std::to_string(random()) + "\n";
  CompressionTrial trial;
  const std::string mixed = text + noise;
  EXPECT_EQ(trial.share(noise.data(), CompressionTrial::kSample), 1);
  EXPECT_EQ(trial.chunkShare(noise.data(), noise.size()), 1);
  EXPECT_LT(trial.share(text.data(), CompressionTrial::kSample), 0.7);
  EXPECT_LT(trial.chunkShare(text.data(), text.size()), 0.7);
  EXPECT_LT(trial.chunkShare(mixed.data(), mixed.size()), CompressionTrial::kHardlyShrinks);
  EXPECT_EQ(trial.chunkShare(noise.data(), 1000), 0);
}

TEST(StoredChunkTest, HoldsItsBytesAsTheyAre) {
  for (const std::size_t size : {0U, 1U, 65534U, 65535U, 65536U, 131070U, 200'000U}) {
    const std::string chunk(size, 'x');
    std::string stored(storedSize(size), '\0');
    stored.resize(storeChunk(chunk.data(), size, true, stored.data()));
    EXPECT_EQ(inflated(stored), chunk);
  }
}

}  // namespace
}  // namespace zal::testing
