#pragma once

#include <cstddef>
#include <limits>
#include <memory>
#include <string_view>
#include <vector>

#include "session/line_part.h"
#include "session/log_lines.h"
#include "session/text_arena.h"
#include "session/zal_pair.h"

namespace zal {

/// The lines of one log: untimed ones first, in the order given, then the timed ones by time, the
/// later arrival first among equal times. A time that is no number goes ahead of everything that is
/// there when it arrives. Main thread only.
///
/// Arriving lines are only appended; the order is made when it is asked for. Inserting each at its
/// place would let one client with a wrong clock make a session quadratic.
class _ZalLoggingAgentSessionSortedLogList {
 public:
  /// Seconds since 1970.
  void addLog(std::string_view text, double time);
  void prependLog(std::string_view text);
  [[nodiscard]] LogLines copySortedLogList() const;
  void removeAllObjects();

  /// The timed lines, which the list has no more: what follows is ordered as if they were there still.
  [[nodiscard]] LinePart takeLines();
  /// The untimed ones.
  [[nodiscard]] LogLines prependedLines() const { return {_prependedLogs, _texts}; }
  [[nodiscard]] std::size_t count() const { return _prependedLogs.size() + _sortedLogList.size(); }

 private:
  std::string_view _keep(std::string_view text);

  /// In order of arrival; second is the time that decides the place, never NaN: see addLog.
  std::vector<ZalPair<std::string_view, double>> _sortedLogList;
  std::vector<std::string_view> _prependedLogs;
  std::shared_ptr<TextArena> _texts;
  double _leastTime = std::numeric_limits<double>::infinity();
};

}  // namespace zal
