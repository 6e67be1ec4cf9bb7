#pragma once

#include <string_view>

namespace zal {

/// The agent's own voice: standard error and the "ZalLogging" log set. Any thread; never waits for
/// a disk. Text is one line, or several that stay together.
class AgentLog {
 public:
  virtual ~AgentLog() = default;
  /// Whether the category is switched on, so that costly texts are not made for nothing.
  [[nodiscard]] virtual bool isEnabled(std::string_view category) const = 0;
  /// A line under a category; dropped unless the category is switched on.
  virtual void log(std::string_view category, std::string_view text) = 0;
  /// A line that is always written.
  virtual void notice(std::string_view text) = 0;
  /// Something went wrong that somebody should look at; always written.
  virtual void warning(std::string_view text) = 0;
  /// The host console, unconditionally; the category only labels the line and may be empty.
  virtual void console(std::string_view category, std::string_view text) = 0;
  /// The calling thread's stack, as a warning of several lines.
  virtual void backtrace() = 0;
};

}  // namespace zal
