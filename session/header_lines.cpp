#include "session/header_lines.h"

#include <utility>

#include "session/session_lines.h"

namespace zal {

void HeaderLines::add(std::string line) { _lines.push_back({.text = std::move(line), .question = {}}); }

void HeaderLines::addAnswer(Question question) {
  _lines.push_back({.text = std::nullopt, .question = std::move(question)});
}

void HeaderLines::addTimed(std::string line) {
  _lines.push_back({.text = std::move(line), .question = {}, .isQuality = false});
}

void HeaderLines::addQuality(std::string line) {
  _lines.push_back({.text = std::move(line), .question = {}, .isTimed = false});
}

void HeaderLines::complete() {
  for (Line& line : _lines) {
    if (line.question) line.text = std::exchange(line.question, {})();
    if (_echo != nullptr && line.text && line.isTimed && line.isQuality) _echo->notice(echoOf(*line.text));
  }
}

std::vector<std::string> HeaderLines::timedLines() const { return _linesOf(&Line::isTimed); }

std::vector<std::string> HeaderLines::qualityLines() const { return _linesOf(&Line::isQuality); }

std::vector<std::string> HeaderLines::_linesOf(bool Line::*log) const {
  std::vector<std::string> texts;
  for (const Line& line : _lines) {
    if (line.text && line.*log) texts.push_back(*line.text);
  }
  return texts;
}

}  // namespace zal
