#pragma once

#include <chrono>
#include <functional>
#include <mutex>
#include <string>
#include <string_view>

#include "platform/linux/ping/ping_statistics.h"

namespace zal {

/// What one ping test has to tell. Any thread: the loop adds to it while a queue may be writing it
/// to a file.
class PingReport {
 public:
  /// More text is left out, and said to be: an echo that multiplies must not fill our memory.
  static constexpr std::size_t kMostBytes = std::size_t{1} << 20U;

  explicit PingReport(std::string host) : _host(std::move(host)) {}

  void addLine(std::string_view line);
  void updateStatistics(const std::function<void(PingStatistics&)>& change);
  /// Why there are no statistics, in one line; also added to the text.
  void fail(std::string reason);
  /// The outcome of a program that did the pinging and whose own text has the statistics in it.
  void setProgramOutcome(std::string summary, bool anyAnswer);

  /// Everything, with the statistics block at the end once a request was sent.
  [[nodiscard]] std::string text() const;
  /// The summary or the reason, in one line.
  [[nodiscard]] std::string resultLine() const;
  [[nodiscard]] bool anyAnswer() const;

 private:
  mutable std::mutex _mutex;  // guards all below
  const std::string _host;
  std::string _lines, _resultLine;
  PingStatistics _statistics;
  bool _anyAnswer = false, _isFull = false;
};

}  // namespace zal
