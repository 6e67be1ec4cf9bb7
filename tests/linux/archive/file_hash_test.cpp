#include "platform/linux/archive/file_hash.h"

#include <gtest/gtest.h>

#include <thread>

namespace zal {
namespace {

constexpr const char* kHashOfAbc = "ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad";

TEST(FileHashTest, ChunksCountInTheirOrderWhoeverComesFirst) {
  FileHash hash;
  std::thread second([&] { hash.add(2, "c", 1, 1); });
  hash.add(0, "ab", 2, 2);
  second.join();
  EXPECT_EQ(hash.takeDigest(), kHashOfAbc);
}

TEST(FileHashTest, NothingCountsBehindAChunkThatCameShort) {
  FileHash hash;
  hash.add(0, "abc", 3, 4);
  EXPECT_TRUE(hash.isTurn(4));
  hash.add(4, "grown again", 11, 11);
  EXPECT_EQ(hash.takeDigest(), kHashOfAbc);
}

}  // namespace
}  // namespace zal
