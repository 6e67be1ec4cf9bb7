#include "platform/linux/blackbox/record_frame.h"

#include <isa-l.h>

#include <optional>

#include "platform/linux/blackbox/record_window.h"
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

/// The length of the piece that such a header announces, if it is one.
std::optional<std::size_t> announcedLength(std::string_view header, std::uint32_t seed) {
  if (!header.starts_with(kMagic)) return std::nullopt;
  if (numberAt(header, kChecked) != checksum(seed, header.substr(0, kChecked))) return std::nullopt;
  return numberAt(header, kMagic.size());
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

std::uint64_t readRecordFrames(RecordWindow& file, std::uint32_t seed,
                               const std::function<void(std::string_view piece)>& handler) {
  std::uint64_t unreadable = 0;
  std::uint64_t read = 0;  // everything before is a piece, or counted
  for (std::uint64_t at = 0; at + kRecordFrameHeaderSize <= file.size();) {
    const auto length = announcedLength(file.from(at, kRecordFrameHeaderSize), seed);
    // A piece that would go beyond the end was torn.
    if (!length || *length > file.size() - at - kRecordFrameHeaderSize) {
      at = file.find(kMagic, at + 1);
      continue;
    }
    const std::size_t size = kRecordFrameHeaderSize + *length;
    const std::string_view frame = file.from(at, size).substr(0, size);
    unreadable += at - read;
    if (isWhole(frame)) {
      handler(frame.substr(kRecordFrameHeaderSize));
    } else {
      unreadable += size;
    }
    at = read = at + size;
  }
  // What was reserved and never written reads as zeros.
  return unreadable + file.endOfContent(read) - read;
}

}  // namespace zal
