#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <utility>

#include "session/session_entry.h"

namespace zal {

class SessionRecord;
class SessionRecords;

/// Keeps what one session takes in the host's black box, from its first entry until its log files have it.
/// Does nothing without a black box. Main thread only.
class SessionRecorder {
 public:
  SessionRecorder(SessionRecords* records, std::string_view sessionType);

  [[nodiscard]] bool isRecording() const { return _records != nullptr; }
  /// Whether the next entry opens a record: what the session still has from before belongs there first.
  [[nodiscard]] bool needsRecord() const { return _records != nullptr && !_record; }
  void open(WallTime now);
  /// Nothing while no record is open.
  void note(const SessionEntry& entry);
  /// The record, if there is one, is of no more use.
  void remove();
  /// The record as it is, which who lets go of it leaves to the next start of the agent; null: there is none.
  [[nodiscard]] std::shared_ptr<SessionRecord> release() { return std::exchange(_record, nullptr); }

 private:
  SessionRecords* _records;
  std::string _sessionType;
  std::shared_ptr<SessionRecord> _record;
  std::string _piece;  // kept for its memory
};

}  // namespace zal
