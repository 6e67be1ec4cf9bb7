#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace zal {

enum class IpFamily { v4, v6 };

using ByteView = std::span<const std::uint8_t>;

inline constexpr std::size_t kIcmpHeaderBytes = 8;
/// Data of one echo request; with the headers it is the 84 bytes that people expect of a ping.
inline constexpr std::size_t kEchoDataBytes = 56;

/// An echo request or its reply; `data` looks into the bytes it was parsed from.
///
///     0       1       2               4               6               8
///     | type  | code  |   checksum    |      id       |   sequence    | data ...
struct EchoPacket {
  bool isReply = false;
  std::uint16_t id = 0;
  std::uint16_t sequence = 0;
  ByteView data;
};

/// The one's complement sum of 16-bit words, complemented; 0 over bytes that include a right one.
[[nodiscard]] std::uint16_t internetChecksum(ByteView bytes);

/// A whole ICMP message. Version 6 leaves the checksum to the kernel, which knows both addresses.
[[nodiscard]] std::vector<std::uint8_t> buildEchoRequest(IpFamily family, std::uint16_t id,
                                                         std::uint16_t sequence, ByteView data);
/// Nothing when it is no echo message, is cut short, or (version 4) its checksum is wrong.
[[nodiscard]] std::optional<EchoPacket> parseEcho(IpFamily family, ByteView message);
/// The head of an echo request of ours as an ICMP error quotes it: data and checksum may be missing.
[[nodiscard]] std::optional<EchoPacket> parseQuotedRequest(IpFamily family, ByteView quoted);
/// What follows the header of a version 4 packet, as raw sockets deliver it; nothing when torn.
[[nodiscard]] std::optional<ByteView> withoutIpv4Header(ByteView packet);

/// The data that makes a request ours: the nonce, the send time for whoever looks at a capture
/// (microseconds since 1970), and counting bytes.
[[nodiscard]] std::vector<std::uint8_t> makeEchoData(std::uint64_t nonce, std::uint64_t sentMicroseconds);
/// Whether the data came from makeEchoData with that nonce.
[[nodiscard]] bool carriesNonce(ByteView data, std::uint64_t nonce);

}  // namespace zal
