#pragma once

#include <chrono>
#include <cstddef>
#include <ostream>
#include <string>

#include "cli/agent_records.h"

namespace zal {

/// Shows a collection while it is made. On a terminal the step that runs is one line that is redrawn,
/// with what is done above it; elsewhere each step is a line when it begins.
class DumpDisplay {
 public:
  /// `columns` of the terminal; 0: there is none whose last line could be redrawn.
  DumpDisplay(std::ostream& out, std::size_t columns) : _out(out), _columns(columns) {}

  /// Before there is anything to show; a terminal alone shows it.
  void waiting(std::string_view what, std::chrono::milliseconds elapsed);
  void update(const DumpView& dump, std::chrono::milliseconds elapsed);
  /// Nothing will be redrawn any more.
  void close();

 private:
  void _print(const std::string& line);
  void _redraw(const std::string& line);

  std::ostream& _out;
  std::size_t _columns;
  std::size_t _printedSteps = 0;
  std::size_t _printedMissing = 0;
  std::string _running;  ///< the line that is being redrawn, to be printed when it is over
  std::string _drawn;    ///< what stands in the terminal's last line now
};

}  // namespace zal
