#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "platform/memory_ledger.h"
#include "platform/work_queue.h"
#include "session/header_lines.h"
#include "session/quality_log_list.h"
#include "session/session_log_writing.h"
#include "session/session_services.h"
#include "session/sorted_log_list.h"
#include "session/spilled_lines.h"

namespace zal {

/// The lines of a session's three logs. What is too much for memory goes to the disk, which changes neither
/// lines nor their order. Main thread only; the services outlive it.
class SessionLogs final : public MemoryUser {
 public:
  explicit SessionLogs(SessionServices& services);
  ~SessionLogs() override;
  SessionLogs(const SessionLogs&) = delete;
  SessionLogs& operator=(const SessionLogs&) = delete;

  /// A line of the simple and the verbose log; seconds since 1970.
  void addCheckpoint(std::string_view line, double time);
  /// A line of the verbose log alone.
  void addDescription(std::string_view line, double time);
  void addQuality(std::string_view line);

  [[nodiscard]] bool hasTimedLines() const;
  /// Whether any of the logs has so many.
  [[nodiscard]] bool anyHas(std::size_t lines) const;
  /// Whether writing them takes longer than the main thread has.
  [[nodiscard]] bool areLarge() const;

  struct Taken {
    std::shared_ptr<SessionLogWriting> writing;
    std::shared_ptr<MemoryHold> hold;  ///< of the lines; let go of on the main thread
  };
  /// Leaves them empty. The files come into the directory, with that ending of their names. The header stands
  /// at their top, in the quality log in the opposite order; whoever writes completes it.
  [[nodiscard]] Taken take(const std::string& directory, const std::string& fileEnding,
                           const std::shared_ptr<HeaderLines>& header);

  [[nodiscard]] std::uint64_t canGiveUp(const MemoryAccount* account) const override;
  void giveUp() override;

 private:
  template <class List>
  struct Log {
    List lines;
    std::shared_ptr<SpilledLines> spilled;
    [[nodiscard]] std::size_t count() const { return lines.count() + (spilled ? spilled->count() : 0); }
  };
  template <class List>
  void _spill(Log<List>& log);
  template <class List>
  [[nodiscard]] SessionLogWriting::File _fileOf(Log<List>& log, std::string path,
                                                std::shared_ptr<const HeaderLines> header);
  void _note(std::uint64_t bytes);
  [[nodiscard]] SpilledLines::Freed _freed();

  SessionServices& _services;
  Log<_ZalLoggingAgentSessionSortedLogList> _simple, _verbose;
  Log<QualityLogList> _quality;
  MemoryHold _hold;                      ///< for the lists
  std::shared_ptr<MemoryHold> _leaving;  ///< for what is on its way to the disk; none: nothing went there
  std::uint64_t _bytes = 0;              ///< of the lists
  std::unique_ptr<WorkQueue> _queue;     ///< to the disk
};

}  // namespace zal
