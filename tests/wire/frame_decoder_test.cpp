#include "platform/linux/wire/frame_decoder.h"

#include <random>

#include <gtest/gtest.h>

namespace zal {
namespace {

using ::testing::Test;

std::string frame(FrameKind kind, std::uint64_t cookie, std::string_view payload) {
  std::string bytes;
  FrameHeader header;
  header.kind = kind;
  header.cookie = cookie;
  appendFrame(bytes, header, payload);
  return bytes;
}

std::string rawHeader(std::uint32_t length, std::uint16_t version, std::uint16_t kind) {
  std::string bytes(kFrameHeaderSize, '\0');
  storeFrameHeader(bytes.data(), {length, version, static_cast<FrameKind>(kind), 0});
  return bytes;
}

class FrameDecoderTest : public Test {
 protected:
  /// Every frame that the bytes complete, as "kind/cookie/payload".
  void give(std::string_view bytes) {
    decoder.feed(bytes);
    while (const auto next = decoder.next()) {
      seen.push_back(std::to_string(static_cast<int>(next->header.kind)) + "/" +
                     std::to_string(next->header.cookie) + "/" + std::string(next->payload));
    }
  }

  FrameDecoder decoder;
  std::vector<std::string> seen;
};

TEST(FrameTest, AFrameIsHeaderPayloadAndZerosUpToAMultipleOfEight) {
  const std::string expected(
      "\x03\0\0\0"
      "\x01\0"
      "\x02\0"
      "\x08\x07\x06\x05\x04\x03\x02\x01"
      "abc\0\0\0\0\0",
      24);
  EXPECT_EQ(frame(FrameKind::reply, 0x0102030405060708U, "abc"), expected);
  EXPECT_EQ(frameSize(0), 16U);
  EXPECT_EQ(frameSize(1), 24U);
  EXPECT_EQ(frameSize(8), 24U);
  EXPECT_EQ(frameSize(9), 32U);
}

TEST_F(FrameDecoderTest, AFrameInsideAChunkIsAViewIntoIt) {
  const std::string bytes = frame(FrameKind::message, 0, "payload!");
  decoder.feed(bytes);
  const auto next = decoder.next();
  ASSERT_TRUE(next.has_value());
  EXPECT_EQ(next->payload.data(), bytes.data() + kFrameHeaderSize);
  EXPECT_FALSE(decoder.next().has_value());
  EXPECT_EQ(decoder.pendingBytes(), 0U);
}

TEST_F(FrameDecoderTest, OneByteAtATimeGivesTheSameFrames) {
  const std::string bytes = frame(FrameKind::message, 0, "one") + frame(FrameKind::barrier, 7, "") +
                            frame(FrameKind::messageExpectingReply, 8, "sixteen bytes ab");
  for (const char byte : bytes) give({&byte, 1});
  EXPECT_EQ(seen, (std::vector<std::string>{"0/0/one", "3/7/", "1/8/sixteen bytes ab"}));
}

TEST_F(FrameDecoderTest, NoCuttingChangesTheFrames) {
  std::mt19937 random(20240229);  // NOLINT: the same cuttings every time
  std::string bytes;
  std::vector<std::string> expected;
  for (int i = 0; i < 200; ++i) {
    const std::string payload(random() % (i % 10 == 0 ? 100000 : 200), static_cast<char>('a' + i % 26));
    bytes += frame(FrameKind::message, static_cast<std::uint64_t>(i), payload);
    expected.push_back("0/" + std::to_string(i) + "/" + payload);
  }
  for (const std::size_t largest : {3U, 17U, 300U, 70000U}) {
    decoder = FrameDecoder();
    seen.clear();
    for (std::size_t at = 0; at < bytes.size();) {
      const std::string chunk = bytes.substr(at, 1 + random() % largest);  // its own memory: freed after
      give(chunk);
      at += chunk.size();
    }
    EXPECT_EQ(seen, expected) << largest;
    EXPECT_EQ(decoder.pendingBytes(), 0U);
  }
}

TEST_F(FrameDecoderTest, ATornFrameIsKeptAndNothingElse) {
  const std::string bytes = frame(FrameKind::message, 0, "first") + frame(FrameKind::message, 1, "second");
  give(std::string_view(bytes).substr(0, 30));
  EXPECT_EQ(seen, std::vector<std::string>{"0/0/first"});
  EXPECT_EQ(decoder.pendingBytes(), 6U);
  give(std::string_view(bytes).substr(30));
  EXPECT_EQ(seen, (std::vector<std::string>{"0/0/first", "0/1/second"}));
}

TEST_F(FrameDecoderTest, APromisedLengthTakesNoMemoryBeforeTheBytesCome) {
  give(rawHeader(kDefaultMaximumPayload, 1, 0));
  EXPECT_FALSE(decoder.failed());
  EXPECT_EQ(decoder.pendingBytes(), kFrameHeaderSize);
}

TEST_F(FrameDecoderTest, LargestPayloadPassesAndOneByteMoreFails) {
  decoder = FrameDecoder(1000);
  give(frame(FrameKind::message, 0, std::string(1000, 'x')));
  EXPECT_EQ(seen.size(), 1U);
  give(frame(FrameKind::message, 0, std::string(1001, 'x')));
  EXPECT_EQ(seen.size(), 1U);
  EXPECT_EQ(decoder.failure(), "payload of 1001 bytes, at most 1000 are allowed");
}

TEST_F(FrameDecoderTest, AnUnknownVersionFails) {
  give(rawHeader(0, 2, 0));
  EXPECT_EQ(decoder.failure(), "unknown protocol version 2");
}

TEST_F(FrameDecoderTest, AnUnknownKindFails) {
  give(rawHeader(0, 1, 5));
  EXPECT_EQ(decoder.failure(), "unknown frame kind 5");
}

TEST_F(FrameDecoderTest, ABarrierWithAPayloadFails) {
  give(rawHeader(8, 1, 3));
  EXPECT_EQ(decoder.failure(), "barrier with a payload of 8 bytes");
}

TEST_F(FrameDecoderTest, FramesBeforeABadHeaderAreHandedOutAndNoneAfterIt) {
  give(frame(FrameKind::message, 0, "good") + rawHeader(0, 9, 0) + frame(FrameKind::message, 0, "late"));
  give(frame(FrameKind::message, 0, "later"));
  EXPECT_EQ(seen, std::vector<std::string>{"0/0/good"});
  EXPECT_TRUE(decoder.failed());
  EXPECT_EQ(decoder.pendingBytes(), 0U);
}

TEST_F(FrameDecoderTest, ATornBadHeaderFailsOnceItIsComplete) {
  const std::string bytes = rawHeader(0xFFFFFFFFU, 1, 0);
  give(std::string_view(bytes).substr(0, 15));
  EXPECT_FALSE(decoder.failed());
  give(std::string_view(bytes).substr(15));
  EXPECT_EQ(decoder.failure(), "payload of 4294967295 bytes, at most 16777216 are allowed");
}

}  // namespace
}  // namespace zal
