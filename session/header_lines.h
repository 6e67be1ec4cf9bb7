#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "platform/agent_log.h"

namespace zal {

/// The lines at the top of one session's logs, in the order of making. One of them may have to be asked for
/// first, which takes its time: that is left to whoever writes the logs. One thread at a time.
class HeaderLines {
 public:
  using Question = std::function<std::optional<std::string>()>;
  /// With a log each line is echoed there, but for those that are only for some of the logs.
  explicit HeaderLines(AgentLog* echo) : _echo(echo) {}

  void add(std::string line);
  /// A line that is the question's answer; without one there is no line.
  void addAnswer(Question question);
  /// For the simple and the verbose log alone.
  void addTimed(std::string line);
  /// For the quality log alone.
  void addQuality(std::string line);

  /// Asks what is to be asked, and echoes. Once, before the lines are taken.
  void complete();
  [[nodiscard]] std::vector<std::string> timedLines() const;
  [[nodiscard]] std::vector<std::string> qualityLines() const;

 private:
  struct Line {
    std::optional<std::string> text;
    Question question;
    bool isTimed = true, isQuality = true;
  };
  [[nodiscard]] std::vector<std::string> _linesOf(bool Line::*log) const;

  AgentLog* const _echo;
  std::vector<Line> _lines;
};

}  // namespace zal
