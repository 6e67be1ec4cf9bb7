#include "cli/dump_display.h"

#include <algorithm>

#include "cli/progress_lines.h"

namespace zal {
namespace {

constexpr const char* kEraseLine = "\r\x1b[K";

}  // namespace

void DumpDisplay::waiting(std::string_view what, std::chrono::milliseconds elapsed) {
  if (_columns != 0) _redraw(elapsedText(elapsed) + "  " + std::string(what));
}

void DumpDisplay::update(const DumpView& dump, std::chrono::milliseconds elapsed) {
  const std::size_t begun = std::min(dump.currentStep, dump.steps.size());
  const bool redraws = _columns != 0 && dump.state == DumpView::State::running;
  // A step whose line is redrawn is printed for good when the next one begins.
  const std::size_t over = redraws && begun != 0 ? begun - 1 : begun;
  for (; _printedSteps < over; ++_printedSteps) {
    const auto began = dump.steps[_printedSteps].began;
    if (began) _print(stepLine(dump, _printedSteps + 1, *began));
  }
  for (; _printedMissing < dump.missing.size(); ++_printedMissing)
    _print(missingLine(dump.missing[_printedMissing]));
  _running.clear();
  if (redraws && begun != 0) {
    _running = stepLine(dump, begun, dump.steps[begun - 1].began.value_or(elapsed));
    _redraw(stepLine(dump, begun, elapsed));
  }
  _out.flush();
}

void DumpDisplay::close() {
  if (!_running.empty()) _print(_running);
  if (!_drawn.empty()) _out << kEraseLine;
  _drawn.clear();
  _out.flush();
}

void DumpDisplay::_print(const std::string& line) {
  if (!_drawn.empty()) _out << kEraseLine;
  _drawn.clear();
  _out << line << "\n";
}

void DumpDisplay::_redraw(const std::string& line) {
  // The last column stays free: a full line makes some terminals begin the next one.
  const std::string shown = fitting(line, _columns - 1);
  if (shown == _drawn) return;
  _out << kEraseLine << shown << std::flush;
  _drawn = shown;
}

}  // namespace zal
