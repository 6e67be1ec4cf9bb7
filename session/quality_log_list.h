#pragma once

#include <cstddef>
#include <memory>
#include <string_view>
#include <vector>

#include "session/line_part.h"
#include "session/log_lines.h"

namespace zal {

/// The lines of the quality log: in order of arrival, behind header lines of which each new one goes
/// to the very front. Main thread only.
class QualityLogList {
 public:
  void append(std::string_view text);
  void insertAtFront(std::string_view text);
  [[nodiscard]] LogLines copy() const;
  void removeAllObjects();

  /// The lines of which the list has no more, numbered in order of arrival in place of times.
  [[nodiscard]] LinePart takeLines();
  [[nodiscard]] LogLines frontLines() const;
  [[nodiscard]] std::size_t count() const { return _front.size() + _lines.size(); }

 private:
  std::string_view _keep(std::string_view text);

  std::vector<std::string_view> _front;  ///< the last one is the first line
  std::vector<std::string_view> _lines;
  std::size_t _taken = 0;
  std::shared_ptr<TextArena> _texts;
};

}  // namespace zal
