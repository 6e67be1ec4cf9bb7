#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>

namespace zal {

/// What one session accepted, piece by piece, until its log files have it. It outlives the process unless
/// removed; letting go of it keeps it. Nothing here fails towards the caller: what cannot be kept is logged
/// once. Main thread only, but for its removal.
class SessionRecord {
 public:
  virtual ~SessionRecord() = default;
  /// Adds a piece at the end; it is safe from the next flush on, or when the main loop sleeps.
  virtual void append(std::string_view piece) = 0;
  /// From now on what is appended is lost. Returned: what takes the record away, to be called once at most,
  /// on any thread, as it waits for the disk; never called, it leaves the record to the next start. The files
  /// in that directory hold everything, or nothing needs to be held when the directory is empty.
  [[nodiscard]] virtual std::function<void()> removal(const std::string& writtenInto) = 0;
};

/// A record that its process did not come to remove. It may be larger than memory. Main thread only.
class UnfinishedRecord {
 public:
  virtual ~UnfinishedRecord() = default;
  /// Gives its pieces to the handler, in order and borrowed for the call; another time the same ones.
  /// Returned: how many bytes are unreadable, damaged ones between the pieces and a torn end.
  virtual std::uint64_t read(const std::function<void(std::string_view piece)>& handler) const = 0;
};

/// The black box: records of sessions that survive the end of the process, however it comes. Main thread
/// only.
class SessionRecords {
 public:
  virtual ~SessionRecords() = default;
  /// A new, empty record; null when none are kept.
  [[nodiscard]] virtual std::shared_ptr<SessionRecord> begin() = 0;
  /// Brings everything that was appended out of the process; on to the medium where that is configured.
  virtual void flush() = 0;
  /// Calls the handler for each record that earlier processes left. True: it has served and goes. False: it
  /// stays for the next time. One under which the process ends, or whose handler throws, is tried once more
  /// the next time and then set aside (logged).
  virtual void recover(const std::function<bool(const UnfinishedRecord& record)>& handler) = 0;
};

}  // namespace zal
