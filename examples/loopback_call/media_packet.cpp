#include "examples/loopback_call/media_packet.h"

namespace loopback {

namespace {

constexpr std::uint16_t kExtensionProfile = 0x4C31;

class Writer {
 public:
  explicit Writer(std::byte* at) : _at(at) {}
  void put(std::uint64_t value, int bytes) {
    for (int shift = (bytes - 1) * 8; shift >= 0; shift -= 8) *_at++ = static_cast<std::byte>(value >> shift);
  }

 private:
  std::byte* _at;
};

class Reader {
 public:
  explicit Reader(const std::byte* at) : _at(at) {}
  std::uint64_t take(int bytes) {
    std::uint64_t value = 0;
    for (; bytes > 0; --bytes) value = value << 8U | std::to_integer<std::uint64_t>(*_at++);
    return value;
  }

 private:
  const std::byte* _at;
};

}  // namespace

std::array<std::byte, kPacketBytes> encode(const MediaPacket& packet) {
  std::array<std::byte, kPacketBytes> bytes{};
  Writer writer(bytes.data());
  writer.put(0x90, 1);  // version 2, one header extension
  writer.put(0x00, 1);  // payload type 0
  writer.put(packet.sequence, 2);
  writer.put(packet.mediaTimestamp, 4);
  writer.put(packet.source, 4);
  writer.put(kExtensionProfile, 2);
  writer.put(kExtensionWords, 2);
  writer.put(packet.sentAt, 8);
  writer.put(packet.echoOfSentAt, 8);
  writer.put(packet.echoHeldFor, 8);
  for (std::size_t i = 0; i < kAudioBytes; ++i) writer.put(0x7F ^ ((packet.sequence + i) & 0x0FU), 1);
  return bytes;
}

std::optional<MediaPacket> decode(std::span<const std::byte> bytes) {
  if (bytes.size() != kPacketBytes) return std::nullopt;
  Reader reader(bytes.data());
  if (reader.take(1) != 0x90 || reader.take(1) != 0x00) return std::nullopt;
  MediaPacket packet;
  packet.sequence = static_cast<std::uint16_t>(reader.take(2));
  packet.mediaTimestamp = static_cast<std::uint32_t>(reader.take(4));
  packet.source = static_cast<std::uint32_t>(reader.take(4));
  if (reader.take(2) != kExtensionProfile || reader.take(2) != kExtensionWords) return std::nullopt;
  packet.sentAt = reader.take(8);
  packet.echoOfSentAt = reader.take(8);
  packet.echoHeldFor = reader.take(8);
  return packet;
}

}  // namespace loopback
