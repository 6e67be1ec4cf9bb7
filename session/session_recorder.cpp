#include "session/session_recorder.h"

#include "platform/session_records.h"
#include "session/entry_codec.h"

namespace zal {

namespace {
/// A piece that a huge entry blew up is not kept.
constexpr std::size_t kLargestSparePiece = 64U << 10U;
}  // namespace

SessionRecorder::SessionRecorder(SessionRecords* records, std::string_view sessionType)
    : _records(records), _sessionType(sessionType) {}

void SessionRecorder::open(WallTime now) {
  _record = _records->begin();
  // Twice: without it the other entries would not find back to their type.
  for (int copy = 0; copy < 2; ++copy) {
    note({.kind = SessionEntryKind::opened, .at = now, .text = _sessionType});
  }
}

void SessionRecorder::note(const SessionEntry& entry) {
  if (!_record) return;
  encodeEntry(entry, _piece);
  _record->append(_piece);
  if (_piece.capacity() > kLargestSparePiece) std::string().swap(_piece);
}

void SessionRecorder::remove() {
  if (!_record) return;
  _record->removal({})();
  _record.reset();
}

}  // namespace zal
