#include <algorithm>
#include <string>
#include <vector>

#include "fuzz/fuzz_entries.h"
#include "fuzz/promise.h"
#include "platform/linux/wire/frame_decoder.h"

namespace zal {
namespace {

constexpr std::uint32_t kMaximumPayload = 4096;

/// All that a reader of the stream learns.
struct Outcome {
  std::vector<std::string> frames;
  std::string failure;
  std::size_t pending = 0;
  bool operator==(const Outcome&) const = default;
};

void take(FrameDecoder& decoder, std::string_view chunk, Outcome& outcome) {
  const std::vector<char> alone(chunk.begin(), chunk.end());  // its ends are watched, and it is gone after
  decoder.feed({alone.data(), alone.size()});
  while (const auto frame = decoder.next()) {
    promise(frame->payload.size() == frame->header.length, "the payload has its declared length");
    promise(frame->header.length <= kMaximumPayload, "no payload is above the maximum");
    outcome.frames.push_back(std::to_string(static_cast<int>(frame->header.kind)) + "/" +
                             std::to_string(frame->header.cookie) + "/" + std::string(frame->payload));
  }
  outcome.failure = decoder.failure();
  outcome.pending = decoder.pendingBytes();
}

}  // namespace

void fuzzFrames(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return;
  const std::size_t count = std::min<std::size_t>(data[0], size - 1);
  const std::vector<std::uint8_t> cuts(data + 1, data + 1 + count);
  const std::string stream(data + 1 + count, data + size);

  Outcome whole;
  FrameDecoder wholeDecoder(kMaximumPayload);
  take(wholeDecoder, stream, whole);

  Outcome cut;
  FrameDecoder decoder(kMaximumPayload);
  std::string_view rest = stream;
  for (std::size_t i = 0; !rest.empty(); ++i) {
    const std::size_t piece = cuts.empty() ? 1 : cuts[i % cuts.size()] + 1U;
    take(decoder, rest.substr(0, piece), cut);
    rest.remove_prefix(std::min(piece, rest.size()));
  }
  promise(cut == whole, "cutting the stream does not change its frames");
}

}  // namespace zal

#ifdef ZAL_FUZZER
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  zal::fuzzFrames(data, size);
  return 0;
}
#endif
