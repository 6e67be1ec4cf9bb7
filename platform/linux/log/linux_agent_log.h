#pragma once

#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "platform/agent_log.h"
#include "platform/log_facility.h"
#include "platform/run_loop.h"

namespace zal {

/// The agent's voice on Linux. Each line goes to standard error at once in one write; and, but for
/// console lines, into the "ZalLogging" log set, at once on the main thread, through the run loop
/// from others. What is said before there is a log facility is kept for it.
class LinuxAgentLog : public AgentLog {
 public:
  struct Options {
    std::vector<std::string> categories;  ///< switched on
    /// Lines carry their priority for the journal, "<4>text", instead of words for people.
    bool forJournal = false;
    int descriptor = 2;
  };
  /// Made on the main thread; outlives all threads that speak and the run loop's posted tasks.
  LinuxAgentLog(RunLoop& mainLoop, Options options);

  /// Main thread only. The facility is borrowed; nullptr gives it back.
  void setLogFacility(PlatformLogFacility* facility);

  [[nodiscard]] bool isEnabled(std::string_view category) const override;
  void log(std::string_view category, std::string_view text) override;
  void notice(std::string_view text) override;
  void warning(std::string_view text) override;
  void console(std::string_view category, std::string_view text) override;
  void backtrace() override;

 private:
  struct Line {
    int level;
    std::string text;
  };
  void _say(int level, std::string_view label, std::string_view text);
  void _print(int level, std::string_view label, std::string_view text) const;
  void _keep(Line line);

  RunLoop& _mainLoop;
  const Options _options;
  const std::thread::id _mainThread = std::this_thread::get_id();
  // Main thread only from here on.
  PlatformLogFacility* _facility = nullptr;
  bool _isRecording = false;
  std::vector<Line> _early;
};

}  // namespace zal
