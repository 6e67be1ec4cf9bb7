#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "fuzz/promise.h"
#include "platform/linux/blackbox/record_frame.h"
#include "platform/linux/blackbox/record_window.h"
#include "platform/linux/wire/little_endian.h"

namespace zal {

struct RecordContent {
  std::vector<std::string> pieces;
  std::uint64_t unreadableBytes = 0;
  bool operator==(const RecordContent&) const = default;
};

/// What a file of records holds, as the agent reads it, but through a window of any width.
inline RecordContent readThroughWindow(std::string_view bytes, std::uint32_t seed, std::size_t width) {
  RecordWindow window(bytes.size(), width, [bytes](std::uint64_t offset, char* buffer, std::size_t size) {
    promise(offset <= bytes.size() && size <= bytes.size() - offset, "nothing is read beyond the end");
    bytes.copy(buffer, size, offset);
  });
  RecordContent content;
  content.unreadableBytes = readRecordFrames(
      window, seed, [&content](std::string_view piece) { content.pieces.emplace_back(piece); });
  return content;
}

/// What it holds, found from all of it at once and with the writer alone: a frame is what the writer would
/// have made of the bytes that follow its header.
inline RecordContent readAsWritten(std::string_view bytes, std::uint32_t seed) {
  constexpr std::size_t kLengthAt = 4;
  constexpr std::size_t kPieceSumAt = 12;
  RecordContent content;
  std::size_t read = 0;
  for (std::size_t at = 0; at + kRecordFrameHeaderSize <= bytes.size();) {
    const std::string_view rest = bytes.substr(at);
    const std::uint64_t length = loadLittle(rest.data() + kLengthAt, 4);
    std::string frame;
    if (rest[0] == 'Z' && length <= rest.size() - kRecordFrameHeaderSize) {
      appendRecordFrame(frame, seed, rest.substr(kRecordFrameHeaderSize, length));
    }
    if (frame.empty() || !rest.starts_with(frame.substr(0, kPieceSumAt))) {
      ++at;
      continue;
    }
    content.unreadableBytes += at - read;
    if (rest.starts_with(frame)) {
      content.pieces.push_back(frame.substr(kRecordFrameHeaderSize));
    } else {
      content.unreadableBytes += frame.size();
    }
    at = read = at + frame.size();
  }
  content.unreadableBytes += bytes.substr(read).find_last_not_of('\0') + 1;
  return content;
}

}  // namespace zal
