#include <string>
#include <vector>

#include "fuzz/fuzz_entries.h"
#include "fuzz/promise.h"
#include "fuzz/record_content.h"
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

  const RecordContent record = readAsWritten(bytes, data[0]);
  // Ends of the window come to lie everywhere.
  for (const std::size_t width : {std::size_t{1}, 1 + size % 61, size}) {
    promise(readThroughWindow(bytes, data[0], width) == record, "the window's width changes nothing");
  }
  std::uint64_t accounted = record.unreadableBytes;
  std::string again;
  for (const std::string& piece : record.pieces) {
    accounted += kRecordFrameHeaderSize + piece.size();
    appendRecordFrame(again, data[0], piece);
    readPiece(piece);
  }
  promise(accounted <= bytes.size(), "a byte counts once");
  promise(
      bytes.substr(accounted).find_first_not_of('\0') == std::string_view::npos || record.unreadableBytes > 0,
      "what is no piece is counted");
  promise(readThroughWindow(again, data[0], size) == RecordContent{record.pieces, 0},
          "what is left is whole");
}

}  // namespace zal

#ifdef ZAL_FUZZER
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  zal::fuzzBlackBox(data, size);
  return 0;
}
#endif
