#include "platform/linux/wire/flex_verifier.h"

#include <random>

#include <gtest/gtest.h>

#include "tests/wire/payloads.h"

namespace zal {
namespace {

using flexbuffers::Builder;

bool isSound(const std::string& bytes) { return verifiedFlexRoot(bytes).has_value(); }

std::string bytes(std::initializer_list<int> values) {
  std::string out;
  for (const int value : values) out.push_back(static_cast<char>(value));
  return out;
}

constexpr int kInt = flexbuffers::FBT_INT << 2;
constexpr int kFloat = flexbuffers::FBT_FLOAT << 2;
constexpr int kString = flexbuffers::FBT_STRING << 2;
constexpr int kMap = flexbuffers::FBT_MAP << 2;
constexpr int kVector = flexbuffers::FBT_VECTOR << 2;

/// {"k": 5}, one byte wide, and how each test breaks it.
const std::string kSmallMap = bytes({'k', 0, 1, 3, 1, 1, 1, 5, kInt, 2, kMap, 1});

TEST(FlexVerifierTest, TheSmallMapIsSound) {
  const auto root = verifiedFlexRoot(kSmallMap);
  ASSERT_TRUE(root.has_value());
  EXPECT_EQ(root->asMap()->find("k").asInt(), 5);
  EXPECT_TRUE(root->asMap()->find("kk").type() == flexbuffers::FBT_NULL);
}

TEST(FlexVerifierTest, EveryChangedByteOfTheSmallMapIsSafeToRead) {
  for (std::size_t at = 0; at < kSmallMap.size(); ++at) {
    for (int value = 0; value < 256; ++value) {
      std::string changed = kSmallMap;
      changed[at] = static_cast<char>(value);
      const std::string exact(changed.data(), changed.size());  // its end is watched by the sanitizer
      if (const auto message = messageOf(exact)) {
        EXPECT_GT(readEverything(*message, {"k", ""}), 0U);
      }
    }
  }
}

TEST(FlexVerifierTest, AKeyWithoutAnEndIsRefused) {
  EXPECT_FALSE(isSound(bytes({'k', 'k', 1, 3, 1, 1, 1, 5, kInt, 2, kMap, 1})));
}

TEST(FlexVerifierTest, MoreKeysThanValuesAreRefused) {
  EXPECT_TRUE(isSound(bytes({'k', 0, 2, 3, 4, 2, 1, 2, 5, 6, kInt, kInt, 4, kMap, 1})));
  EXPECT_FALSE(isSound(bytes({'k', 0, 2, 3, 4, 2, 1, 1, 5, kInt, 2, kMap, 1})));
}

TEST(FlexVerifierTest, AnOffsetThatLeavesTheBufferIsRefused) {
  EXPECT_FALSE(isSound(bytes({'k', 0, 1, 3, 1, 1, 1, 5, kInt, 10, kMap, 1})));
  EXPECT_FALSE(isSound(bytes({'k', 0, 1, 4, 1, 1, 1, 5, kInt, 2, kMap, 1})));
  EXPECT_FALSE(isSound(bytes({'k', 0, 1, 3, 5, 1, 1, 5, kInt, 2, kMap, 1})));
}

TEST(FlexVerifierTest, ALengthPastTheEndIsRefused) {
  EXPECT_TRUE(isSound(bytes({2, 'h', 'i', 0, 3, kString, 1})));
  EXPECT_TRUE(isSound(bytes({5, 'h', 'i', 0, 3, kString, 1})));
  EXPECT_FALSE(isSound(bytes({6, 'h', 'i', 0, 3, kString, 1})));
  EXPECT_FALSE(isSound(bytes({0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 'h', 0, 2, kString + 3, 1})));
}

TEST(FlexVerifierTest, FloatsNarrowerThanFourBytesAreRefused) {
  EXPECT_FALSE(isSound(bytes({0, 0, kFloat + 1, 2})));
  EXPECT_TRUE(isSound(bytes({0, 0, 0x90, 0x40, kFloat + 2, 4})));
}

TEST(FlexVerifierTest, AVectorInsideItselfIsRefused) {
  EXPECT_FALSE(isSound(bytes({1, 0, kVector, 2, kVector, 1})));           // offset 0: its own slot
  EXPECT_FALSE(isSound(bytes({2, 7, 1, kInt, kVector, 4, kVector, 1})));  // its second element is itself
}

TEST(FlexVerifierTest, NestingPassesToDepthThirtyTwoAndNotBeyond) {
  const auto nested = [](int depth) {
    Builder builder;
    std::function<void(int)> fill = [&](int left) {
      builder.Vector([&] {
        if (left > 1) fill(left - 1);
      });
    };
    fill(depth);
    builder.Finish();
    return std::string(builder.GetBuffer().begin(), builder.GetBuffer().end());
  };
  EXPECT_TRUE(isSound(nested(32)));
  EXPECT_FALSE(isSound(nested(33)));
}

TEST(FlexVerifierTest, VectorsThatShareEachOtherCostNoMoreThanTheirBytes) {
  // Each of thirty levels points at the one below a hundred times: 10^60 visits if all were made.
  std::string buffer = bytes({1, 0, 5, 0, kInt + 1, 0});  // the lowest: one number, two bytes wide
  std::size_t below = 2;
  for (int level = 0; level < 30; ++level) {
    buffer += bytes({100, 0});
    const std::size_t start = buffer.size();
    for (int i = 0; i < 100; ++i) {
      const std::size_t offset = buffer.size() - below;
      buffer += bytes({static_cast<int>(offset & 0xFFU), static_cast<int>(offset >> 8U)});
    }
    buffer += std::string(100, static_cast<char>(kVector + 1));
    below = start;
  }
  const std::size_t offset = buffer.size() - below;
  buffer += bytes({static_cast<int>(offset & 0xFFU), static_cast<int>(offset >> 8U), kVector + 1, 2});
  EXPECT_FALSE(isSound(buffer));  // or the test never ends
}

TEST(FlexVerifierTest, HonestSharingOfTextsAndKeysPasses) {
  EXPECT_TRUE(isSound(flexMap(
      [](Builder& b) {
        b.Vector("list", [&] {
          for (int i = 0; i < 1000; ++i) {
            b.Map([&] {
              b.String("first", "the same");
              b.String("second", "the same");
            });
          }
        });
      },
      flexbuffers::BUILDER_FLAG_SHARE_ALL)));
}

TEST(FlexVerifierTest, UnsortedAndRepeatedKeysAreOnlyEverFoundOrMissed) {
  const std::string unsorted =
      bytes({'z', 0, 'a', 0, 'a', 0, 3, 7, 6, 5, 3, 1, 3, 1, 2, 3, kInt, kInt, kInt, 6, kMap, 1});
  const auto root = verifiedFlexRoot(unsorted);
  ASSERT_TRUE(root.has_value());
  const auto map = root->asMap();
  EXPECT_EQ(map->key(0), "z");
  EXPECT_EQ(map->key(2), "a");
  EXPECT_EQ(map->find("a").asInt(), 2);
  EXPECT_EQ(map->find("z").asInt(), std::nullopt);
}

TEST(FlexVerifierTest, RandomChangesToARealMessageAreSafeToRead) {
  const std::string real = flexMap([](Builder& b) {
    b.Int("__ipc__event_code__", 9);
    b.String("sender", std::string(300, 's'));
    b.Map("userInfo", [&] {
      b.Double("real", 0.1);
      b.Vector("list", [&] { b.String("x"); });
    });
  });
  std::mt19937 random(7);  // NOLINT: the same changes every time
  for (int round = 0; round < 20'000; ++round) {
    std::string changed = real;
    for (int i = 0; i < 3; ++i) changed[random() % changed.size()] = static_cast<char>(random());
    if (const auto message = messageOf(changed)) {
      EXPECT_GT(readEverything(*message, {"__ipc__event_code__", "sender", "userInfo"}), 0U);
    }
  }
}

}  // namespace
}  // namespace zal
