#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "platform/agent_log.h"
#include "platform/spill_files.h"
#include "session/line_part.h"
#include "session/line_runs.h"
#include "session/log_lines.h"

namespace zal {

class FilePlacement;

/// What of one log is too much for memory. Its parts, in order of arrival, go to the disk as sorted runs and
/// come together again when the log is written. A part that the disk refuses stays where it is, is tried
/// again with the next one, and is logged once. Any thread.
class SpilledLines {
 public:
  /// Told how many bytes (memoryOfLine) left memory; any thread.
  using Freed = std::function<void(std::uint64_t bytes)>;
  /// Files and log outlive it.
  SpilledLines(SpillFiles& files, AgentLog& log, Freed freed);

  /// Quick: settle() does the work.
  void add(LinePart part);
  /// Brings to the disk what was added.
  void settle();
  [[nodiscard]] std::size_t count() const;

  /// Writes the log: the header lines, and in the order of one sorted list all that was added and the rest,
  /// which came after it. Returned: whether everything is in the file.
  [[nodiscard]] bool write(const LogLines& header, const LinePart& rest, FilePlacement& files,
                           const std::string& path);

 private:
  struct Waiting {
    LinePart part;
    std::size_t done = 0;  ///< of its lines, those that are in runs
  };
  [[nodiscard]] bool _settleSome(Waiting& waiting);
  [[nodiscard]] std::vector<std::unique_ptr<LineRunReader>> _readers(const LinePart& rest);

  SpillFiles& _files;
  AgentLog& _log;
  const Freed _freed;

  std::mutex _working;  // whoever has it does the work; taken before the other one
  std::unique_ptr<SpillFile> _file;
  std::vector<LineRun> _runs;
  std::string _buffer;
  bool _saidRefused = false;

  mutable std::mutex _adding;
  std::deque<Waiting> _waiting;  // the elements belong to who works
  std::size_t _count = 0;
};

}  // namespace zal
