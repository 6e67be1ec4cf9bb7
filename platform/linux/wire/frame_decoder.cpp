#include "platform/linux/wire/frame_decoder.h"

#include <algorithm>

#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

/// One large frame must not leave its buffer behind for the life of the connection.
constexpr std::size_t kKeptCapacity = 64U << 10U;

}  // namespace

void FrameDecoder::feed(std::string_view bytes) {
  _releaseRest();
  _chunk = bytes;
}

std::optional<Frame> FrameDecoder::next() {
  _releaseRest();
  if (failed()) return std::nullopt;

  if (!_rest.empty()) {
    if (!_headerRead) {
      if (!_completeRest(kFrameHeaderSize)) return std::nullopt;
      if (!_readHeader(_rest.data())) return std::nullopt;
      _headerRead = true;
    }
    if (!_completeRest(frameSize(_header.length))) return std::nullopt;
    _handedOut = true;
    return Frame{_header, std::string_view(_rest).substr(kFrameHeaderSize, _header.length)};
  }

  if (_chunk.size() >= kFrameHeaderSize) {
    if (!_readHeader(_chunk.data())) return std::nullopt;
    const std::size_t size = frameSize(_header.length);
    if (_chunk.size() >= size) {
      const Frame frame{_header, _chunk.substr(kFrameHeaderSize, _header.length)};
      _chunk.remove_prefix(size);
      return frame;
    }
    _headerRead = true;
  }
  _rest.assign(_chunk);
  _chunk = {};
  return std::nullopt;
}

/// Moves bytes from the chunk to the torn frame until it has `wanted`, or the chunk is used up.
bool FrameDecoder::_completeRest(std::size_t wanted) {
  const std::size_t taken = std::min(wanted - std::min(wanted, _rest.size()), _chunk.size());
  _rest.append(_chunk.substr(0, taken));
  _chunk.remove_prefix(taken);
  return _rest.size() >= wanted;
}

bool FrameDecoder::_readHeader(const char* bytes) {
  const auto length = static_cast<std::uint32_t>(loadLittle(bytes, 4));
  const auto version = static_cast<std::uint16_t>(loadLittle(bytes + 4, 2));
  const auto kind = static_cast<std::uint16_t>(loadLittle(bytes + 6, 2));
  if (version != kProtocolVersion) {
    _failure = "unknown protocol version " + std::to_string(version);
  } else if (kind > static_cast<std::uint16_t>(FrameKind::barrierPassed)) {
    _failure = "unknown frame kind " + std::to_string(kind);
  } else if (length > _maximumPayload) {
    _failure = "payload of " + std::to_string(length) + " bytes, at most " + std::to_string(_maximumPayload) +
               " are allowed";
  } else if (length != 0 && kind >= static_cast<std::uint16_t>(FrameKind::barrier)) {
    _failure = "barrier with a payload of " + std::to_string(length) + " bytes";
  }
  if (failed()) {
    _chunk = {};
    std::string().swap(_rest);
    return false;
  }
  _header = {length, version, static_cast<FrameKind>(kind), loadLittle(bytes + 8, 8)};
  return true;
}

/// The frame handed out from _rest is no longer looked at.
void FrameDecoder::_releaseRest() {
  if (!_handedOut) return;
  _handedOut = false;
  _headerRead = false;
  if (_rest.capacity() > kKeptCapacity) {
    std::string().swap(_rest);
  } else {
    _rest.clear();
  }
}

}  // namespace zal
