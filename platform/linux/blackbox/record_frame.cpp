#include "platform/linux/blackbox/record_frame.h"

#include <isa-l.h>

#include <optional>

#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

constexpr std::string_view kMagic{"ZR\xB1\x01", 4};
/// Of the header, what its own checksum covers.
constexpr std::size_t kChecked = 8;
constexpr std::size_t kNumber = 4;

std::uint32_t numberAt(std::string_view bytes, std::size_t at) {
  return static_cast<std::uint32_t>(loadLittle(bytes.data() + at, kNumber));
}

std::uint32_t checksum(std::uint32_t seed, std::string_view bytes) {
  // The library takes an int and does not change what it is given.
  auto* data = reinterpret_cast<unsigned char*>(const_cast<char*>(bytes.data()));
  constexpr std::size_t kMost = 1U << 30U;
  for (; bytes.size() > kMost; bytes.remove_prefix(kMost), data += kMost) {
    seed = ::crc32_iscsi(data, static_cast<int>(kMost), seed);
  }
  return ::crc32_iscsi(data, static_cast<int>(bytes.size()), seed);
}

/// The length of the piece that begins here, if a header does.
std::optional<std::size_t> pieceLength(std::string_view bytes, std::uint32_t seed) {
  if (bytes.size() < kRecordFrameHeaderSize || !bytes.starts_with(kMagic)) return std::nullopt;
  if (numberAt(bytes, kChecked) != checksum(seed, bytes.substr(0, kChecked))) return std::nullopt;
  const std::size_t length = numberAt(bytes, kMagic.size());
  if (length > bytes.size() - kRecordFrameHeaderSize) return std::nullopt;  // torn
  return length;
}

bool isWhole(std::string_view frame) {
  const std::uint32_t headerSum = numberAt(frame, kChecked);
  return numberAt(frame, kChecked + kNumber) == checksum(headerSum, frame.substr(kRecordFrameHeaderSize));
}

}  // namespace

void appendRecordFrame(std::string& bytes, std::uint32_t seed, std::string_view piece) {
  char header[kRecordFrameHeaderSize];
  kMagic.copy(header, kMagic.size());
  storeLittle(header + kMagic.size(), piece.size(), kNumber);
  const std::uint32_t headerSum = checksum(seed, {header, kChecked});
  storeLittle(header + kChecked, headerSum, kNumber);
  storeLittle(header + kChecked + kNumber, checksum(headerSum, piece), kNumber);
  bytes.append(header, sizeof header).append(piece);
}

UnfinishedRecord readRecordFrames(std::string_view bytes, std::uint32_t seed) {
  UnfinishedRecord record;
  std::size_t read = 0;  // everything before is a piece, or counted
  for (std::size_t at = 0; at != std::string_view::npos;) {
    const auto length = pieceLength(bytes.substr(at), seed);
    if (!length) {
      at = bytes.find(kMagic, at + 1);
      continue;
    }
    const std::string_view frame = bytes.substr(at, kRecordFrameHeaderSize + *length);
    record.unreadableBytes += at - read;
    if (isWhole(frame)) {
      record.pieces.push_back(frame.substr(kRecordFrameHeaderSize));
    } else {
      record.unreadableBytes += frame.size();
    }
    at = read = at + frame.size();
  }
  // What was reserved and never written reads as zeros.
  const std::size_t last = bytes.substr(read).find_last_not_of('\0');
  if (last != std::string_view::npos) record.unreadableBytes += last + 1;
  return record;
}

}  // namespace zal
