#include "platform/linux/ping/icmp_packet.h"

#include <gtest/gtest.h>

#include <random>

namespace zal {
namespace {

using Bytes = std::vector<std::uint8_t>;

/// The reply that a host would make of a request: another type, the checksum to match.
Bytes replyTo(IpFamily family, Bytes request) {
  request[0] = family == IpFamily::v4 ? 0 : 129;
  request[2] = request[3] = 0;
  if (family == IpFamily::v4) {
    const std::uint16_t sum = internetChecksum(request);
    request[2] = static_cast<std::uint8_t>(sum >> 8U);
    request[3] = static_cast<std::uint8_t>(sum);
  }
  return request;
}

TEST(IcmpPacketTest, ChecksumOfKnownBytes) {
  EXPECT_EQ(internetChecksum(Bytes{0x00, 0x01, 0xf2, 0x03, 0xf4, 0xf5, 0xf6, 0xf7}), 0x220d);
  EXPECT_EQ(internetChecksum(Bytes{0x01}), 0xfeff);
  EXPECT_EQ(internetChecksum(Bytes{}), 0xffff);
}

TEST(IcmpPacketTest, RequestOfVersionFourByByte) {
  const Bytes data{0xAA, 0xBB};
  EXPECT_EQ(buildEchoRequest(IpFamily::v4, 0x1234, 0x0102, data),
            (Bytes{8, 0, 0x3A, 0x0E, 0x12, 0x34, 0x01, 0x02, 0xAA, 0xBB}));
}

TEST(IcmpPacketTest, RequestOfVersionSixLeavesTheChecksumToTheKernel) {
  EXPECT_EQ(buildEchoRequest(IpFamily::v6, 0x1234, 0x0102, Bytes{7}),
            (Bytes{128, 0, 0, 0, 0x12, 0x34, 0x01, 0x02, 7}));
}

TEST(IcmpPacketTest, DataIsFiftySixBytesThatCarryTheNonce) {
  const auto data = makeEchoData(0x0102030405060708, 0x1112131415161718);
  ASSERT_EQ(data.size(), 56U);
  EXPECT_EQ(Bytes(data.begin(), data.begin() + 18),
            (Bytes{1, 2, 3, 4, 5, 6, 7, 8, 0x11, 0x12, 0x13, 0x14, 0x15, 0x16, 0x17, 0x18, 16, 17}));
  EXPECT_TRUE(carriesNonce(data, 0x0102030405060708));
  EXPECT_FALSE(carriesNonce(data, 0x0102030405060709));
  EXPECT_FALSE(carriesNonce(ByteView(data).first(8), 0x0102030405060708));
}

TEST(IcmpPacketTest, ReplyIsReadBack) {
  for (const auto family : {IpFamily::v4, IpFamily::v6}) {
    const Bytes reply = replyTo(family, buildEchoRequest(family, 0xBEEF, 513, makeEchoData(9, 0)));
    const auto echo = parseEcho(family, reply);
    ASSERT_TRUE(echo);
    EXPECT_TRUE(echo->isReply);
    EXPECT_EQ(echo->id, 0xBEEF);
    EXPECT_EQ(echo->sequence, 513);
    EXPECT_TRUE(carriesNonce(echo->data, 9));
  }
}

TEST(IcmpPacketTest, DamagedReplyIsRefused) {
  Bytes reply = replyTo(IpFamily::v4, buildEchoRequest(IpFamily::v4, 1, 1, makeEchoData(9, 0)));
  reply.back() ^= 1U;
  EXPECT_FALSE(parseEcho(IpFamily::v4, reply));
}

TEST(IcmpPacketTest, OtherMessagesAreNoEcho) {
  EXPECT_FALSE(parseEcho(IpFamily::v6, Bytes{135, 0, 0, 0, 0, 0, 0, 0}));
  EXPECT_FALSE(parseEcho(IpFamily::v6, Bytes{129, 1, 0, 0, 0, 0, 0, 0}));
  EXPECT_FALSE(parseEcho(IpFamily::v6, Bytes{129, 0, 0, 0, 0, 0, 0}));
}

TEST(IcmpPacketTest, QuotedRequestMayBeCutAfterItsHeader) {
  const auto request = buildEchoRequest(IpFamily::v4, 7, 8, makeEchoData(9, 0));
  const auto quoted = parseQuotedRequest(IpFamily::v4, ByteView(request).first(8));
  ASSERT_TRUE(quoted);
  EXPECT_EQ(quoted->id, 7);
  EXPECT_EQ(quoted->sequence, 8);
  EXPECT_FALSE(parseQuotedRequest(IpFamily::v4, ByteView(request).first(7)));
  EXPECT_FALSE(parseQuotedRequest(IpFamily::v4, replyTo(IpFamily::v4, request)));
}

TEST(IcmpPacketTest, HeaderOfVersionFourIsTakenOffWithItsOptions) {
  Bytes packet(24, 0);
  packet[0] = 0x46;  // six words
  packet.push_back(42);
  const auto inner = withoutIpv4Header(packet);
  ASSERT_TRUE(inner);
  ASSERT_EQ(inner->size(), 1U);
  EXPECT_EQ(inner->front(), 42);
}

TEST(IcmpPacketTest, TornHeaderOfVersionFourIsRefused) {
  Bytes packet(20, 0);
  packet[0] = 0x46;
  EXPECT_FALSE(withoutIpv4Header(packet));
  packet[0] = 0x44;
  EXPECT_FALSE(withoutIpv4Header(packet));
  packet[0] = 0x65;
  EXPECT_FALSE(withoutIpv4Header(packet));
  EXPECT_FALSE(withoutIpv4Header(ByteView(packet).first(19)));
}

TEST(IcmpPacketTest, RandomBytesNeverReadPastTheirEnd) {
  std::mt19937 random(20240502);  // the same bytes each time; the address sanitizer watches
  std::uniform_int_distribution<unsigned> byte(0, 255), length(0, 96);
  std::size_t parsed = 0;
  for (int round = 0; round < 20000; ++round) {
    const std::vector<std::uint8_t> bytes = [&] {
      std::vector<std::uint8_t> made(length(random));
      for (auto& value : made) value = static_cast<std::uint8_t>(byte(random));
      // Half of them look like something, so that the parsers get beyond the first byte.
      if (!made.empty() && round % 2 == 0) made[0] = round % 4 == 0 ? 0x45 : 129;
      if (made.size() > 1 && round % 2 == 0) made[1] = 0;
      return made;
    }();
    for (const auto family : {IpFamily::v4, IpFamily::v6}) {
      for (const auto& echo : {parseEcho(family, bytes), parseQuotedRequest(family, bytes)}) {
        if (!echo) continue;
        ++parsed;
        EXPECT_EQ(echo->data.size(), bytes.size() - kIcmpHeaderBytes);
        EXPECT_FALSE(carriesNonce(echo->data, 0x123456789ABCDEF0));
      }
    }
    if (const auto inner = withoutIpv4Header(bytes)) {
      ++parsed;
      EXPECT_LE(inner->size() + 20, bytes.size());
      (void)parseEcho(IpFamily::v4, *inner);
    }
  }
  EXPECT_GT(parsed, 1000U);
}

}  // namespace
}  // namespace zal
