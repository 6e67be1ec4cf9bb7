#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>

namespace loopback {

/// One packet of the example's media: an RTP header as RFC 3550 lays it out (version 2, payload type
/// 0, 8 kHz clock), an extension that carries what RTCP reports would, and 20 ms of audio payload.
struct MediaPacket {
  std::uint16_t sequence = 0;
  std::uint32_t mediaTimestamp = 0;  ///< 8 kHz units
  std::uint32_t source = 0;          ///< SSRC of the sender
  std::uint64_t sentAt = 0;          ///< sender's steady clock, nanoseconds
  std::uint64_t echoOfSentAt = 0;    ///< `sentAt` of the last packet that the sender received; 0: none yet
  std::uint64_t echoHeldFor = 0;     ///< how long the sender has held that packet, nanoseconds
};

inline constexpr std::size_t kAudioBytes = 160;  // 20 ms of 8 kHz, 8-bit audio (RFC 3551, PCMU)
inline constexpr std::size_t kExtensionWords = 6;
inline constexpr std::size_t kPacketBytes = 12 + 4 + kExtensionWords * 4 + kAudioBytes;

/// Network byte order throughout; the audio is a quiet tone that depends on the sequence number.
std::array<std::byte, kPacketBytes> encode(const MediaPacket& packet);
/// Nothing for bytes that are no packet of ours.
std::optional<MediaPacket> decode(std::span<const std::byte> bytes);

}  // namespace loopback
