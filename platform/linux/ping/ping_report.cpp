#include "platform/linux/ping/ping_report.h"

#include <utility>

namespace zal {

void PingReport::addLine(std::string_view line) {
  const std::scoped_lock lock(_mutex);
  if (_isFull) return;
  if (_lines.size() + line.size() > kMostBytes) {
    _isFull = true;
    line = "(further lines left out)";
  }
  _lines.append(line) += '\n';
}

void PingReport::updateStatistics(const std::function<void(PingStatistics&)>& change) {
  const std::scoped_lock lock(_mutex);
  change(_statistics);
}

void PingReport::fail(std::string reason) {
  addLine("ping: " + reason);
  const std::scoped_lock lock(_mutex);
  _resultLine = std::move(reason);
}

void PingReport::setProgramOutcome(std::string summary, bool anyAnswer) {
  const std::scoped_lock lock(_mutex);
  _resultLine = std::move(summary);
  _anyAnswer = anyAnswer;
}

std::string PingReport::text() const {
  const std::scoped_lock lock(_mutex);
  std::string text = _lines;
  if (_statistics.transmitted == 0) return text;
  text += "\n--- " + _host + " ping statistics ---\n" + _statistics.summary() + "\n";
  if (const std::string roundTrips = _statistics.roundTripLine(); !roundTrips.empty()) {
    text += roundTrips + "\n";
  }
  return text;
}

std::string PingReport::resultLine() const {
  const std::scoped_lock lock(_mutex);
  return _resultLine.empty() ? _statistics.summary() : _resultLine;
}

bool PingReport::anyAnswer() const {
  const std::scoped_lock lock(_mutex);
  return _anyAnswer || _statistics.received() > 0;
}

}  // namespace zal
