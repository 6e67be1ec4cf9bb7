#include "platform/linux/ping/icmp_packet.h"

#include <netinet/icmp6.h>
#include <netinet/ip_icmp.h>
#include <algorithm>

namespace zal {
namespace {

constexpr std::size_t kNonceBytes = 8;
constexpr std::size_t kTimeBytes = 8;

std::uint16_t readWord(ByteView bytes, std::size_t at) {
  return static_cast<std::uint16_t>(bytes[at] << 8U | bytes[at + 1]);
}

void writeWord(std::vector<std::uint8_t>& bytes, std::size_t at, std::uint16_t value) {
  bytes[at] = static_cast<std::uint8_t>(value >> 8U);
  bytes[at + 1] = static_cast<std::uint8_t>(value);
}

void appendBigEndian(std::vector<std::uint8_t>& bytes, std::uint64_t value) {
  for (unsigned shift = 64; shift > 0; shift -= 8) {
    bytes.push_back(static_cast<std::uint8_t>(value >> (shift - 8)));
  }
}

std::uint8_t requestType(IpFamily family) { return family == IpFamily::v4 ? ICMP_ECHO : ICMP6_ECHO_REQUEST; }

std::uint8_t replyType(IpFamily family) { return family == IpFamily::v4 ? ICMP_ECHOREPLY : ICMP6_ECHO_REPLY; }

std::optional<EchoPacket> readHeader(IpFamily family, ByteView message) {
  if (message.size() < kIcmpHeaderBytes) return std::nullopt;
  const bool isReply = message[0] == replyType(family);
  if (!isReply && message[0] != requestType(family)) return std::nullopt;
  if (message[1] != 0) return std::nullopt;
  return EchoPacket{isReply, readWord(message, 4), readWord(message, 6), message.subspan(kIcmpHeaderBytes)};
}

}  // namespace

std::uint16_t internetChecksum(ByteView bytes) {
  std::uint32_t sum = 0;
  for (std::size_t i = 0; i + 1 < bytes.size(); i += 2) sum += readWord(bytes, i);
  if (bytes.size() % 2 != 0) sum += static_cast<std::uint32_t>(bytes.back()) << 8U;
  while (sum > 0xFFFFU) sum = (sum & 0xFFFFU) + (sum >> 16U);
  return static_cast<std::uint16_t>(~sum);
}

std::vector<std::uint8_t> buildEchoRequest(IpFamily family, std::uint16_t id, std::uint16_t sequence,
                                           ByteView data) {
  std::vector<std::uint8_t> message(kIcmpHeaderBytes + data.size());
  message[0] = requestType(family);
  writeWord(message, 4, id);
  writeWord(message, 6, sequence);
  std::copy(data.begin(), data.end(), message.begin() + kIcmpHeaderBytes);
  if (family == IpFamily::v4) writeWord(message, 2, internetChecksum(message));
  return message;
}

std::optional<EchoPacket> parseEcho(IpFamily family, ByteView message) {
  auto packet = readHeader(family, message);
  if (packet && family == IpFamily::v4 && internetChecksum(message) != 0) return std::nullopt;
  return packet;
}

std::optional<EchoPacket> parseQuotedRequest(IpFamily family, ByteView quoted) {
  auto packet = readHeader(family, quoted);
  if (packet && packet->isReply) return std::nullopt;
  return packet;
}

std::optional<ByteView> withoutIpv4Header(ByteView packet) {
  constexpr std::size_t kSmallestHeader = 20;
  if (packet.size() < kSmallestHeader || packet[0] >> 4U != 4) return std::nullopt;
  const std::size_t header = (packet[0] & 15U) * std::size_t{4};
  if (header < kSmallestHeader || header > packet.size()) return std::nullopt;
  return packet.subspan(header);
}

std::vector<std::uint8_t> makeEchoData(std::uint64_t nonce, std::uint64_t sentMicroseconds) {
  std::vector<std::uint8_t> data;
  data.reserve(kEchoDataBytes);
  appendBigEndian(data, nonce);
  appendBigEndian(data, sentMicroseconds);
  while (data.size() < kEchoDataBytes) data.push_back(static_cast<std::uint8_t>(data.size()));
  return data;
}

bool carriesNonce(ByteView data, std::uint64_t nonce) {
  if (data.size() < kNonceBytes + kTimeBytes) return false;
  std::uint64_t found = 0;
  for (std::size_t i = 0; i < kNonceBytes; ++i) found = found << 8U | data[i];
  return found == nonce;
}

}  // namespace zal
