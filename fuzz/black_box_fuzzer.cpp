#include <string>
#include <vector>

#include "fuzz/fuzz_entries.h"
#include "fuzz/promise.h"
#include "platform/linux/blackbox/record_frame.h"
#include "session/entry_codec.h"

namespace zal {
namespace {

void readPiece(std::string_view piece) {
  const auto entry = decodeEntry(piece);
  if (!entry) return;
  std::string again;
  encodeEntry(*entry, again);
  promise(again == piece, "an entry that was read is written as it was");
}

}  // namespace

void fuzzBlackBox(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return;
  const std::vector<char> alone(data + 1, data + size);  // its ends are watched
  const std::string_view bytes(alone.data(), alone.size());
  if (data[0] == 0) return readPiece(bytes);

  const UnfinishedRecord record = readRecordFrames(bytes, data[0]);
  std::uint64_t accounted = record.unreadableBytes;
  const char* last = bytes.data();
  std::string again;
  for (const std::string_view piece : record.pieces) {
    promise(piece.data() >= last && piece.data() + piece.size() <= bytes.data() + bytes.size(),
            "pieces are parts of the file, in its order");
    last = piece.data() + piece.size();
    accounted += kRecordFrameHeaderSize + piece.size();
    appendRecordFrame(again, data[0], piece);
    readPiece(piece);
  }
  promise(accounted <= bytes.size(), "a byte counts once");
  promise(
      bytes.substr(accounted).find_first_not_of('\0') == std::string_view::npos || record.unreadableBytes > 0,
      "what is no piece is counted");
  promise(readRecordFrames(again, data[0]).pieces.size() == record.pieces.size(), "what is left is whole");
}

}  // namespace zal

#ifdef ZAL_FUZZER
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  zal::fuzzBlackBox(data, size);
  return 0;
}
#endif
