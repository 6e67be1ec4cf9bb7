#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/wire/frame.h"

namespace zal {

/// A whole frame; the payload is a view, without its padding.
struct Frame {
  FrameHeader header;
  std::string_view payload;
};

/// Cuts a byte stream, given in chunks of any size, into frames. One decoder per stream, one thread.
///
///     decoder.feed(bytesJustRead);               // borrowed until next() gives nothing
///     while (auto frame = decoder.next()) { … }  // a view, until next() or feed() is called again
///     if (decoder.failed()) …                    // nothing more comes out of this stream
///
/// Frames that lie whole inside a chunk are handed out where they lie. Only the torn one at the end
/// is kept, and grows by what arrives, never by what its header promises:
///
///     chunk 1  |hhhh pppp pp00|hhhh pp          two frames: the first is a view into the chunk,
///                             |hhhh pp|         this much is kept
///     chunk 2              pp pp00|hh           the kept one is completed, then handed out
///                                 |hh|          half a header is kept
///
/// After feed(), next() has to be called until it gives nothing: that is when the rest is kept.
class FrameDecoder {
 public:
  explicit FrameDecoder(std::uint32_t maximumPayload = kDefaultMaximumPayload)
      : _maximumPayload(maximumPayload) {}

  void feed(std::string_view bytes);
  [[nodiscard]] std::optional<Frame> next();

  /// True after a header that leaves no way to find the next one: a length above the maximum, an
  /// unknown version, an unknown kind, or a barrier (asked or passed) that claims a payload.
  [[nodiscard]] bool failed() const { return !_failure.empty(); }
  /// What was wrong, in words; empty while all is well.
  [[nodiscard]] const std::string& failure() const { return _failure; }
  /// Bytes of the torn frame that is kept.
  [[nodiscard]] std::size_t pendingBytes() const { return _rest.size(); }

 private:
  [[nodiscard]] bool _readHeader(const char* bytes);
  [[nodiscard]] bool _completeRest(std::size_t wanted);
  void _releaseRest();

  std::uint32_t _maximumPayload;
  FrameHeader _header;       // of the frame that _rest begins with, once it is complete
  std::string_view _chunk;   // not looked at yet
  std::string _rest;         // the torn frame
  bool _handedOut = false;   // _rest was given away as a frame
  bool _headerRead = false;  // _header holds the header of _rest
  std::string _failure;
};

}  // namespace zal
