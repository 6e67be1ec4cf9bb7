#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "platform/value.h"
#include "session/optional_text.h"

namespace zal {

/// What the messaging test tool is told at least, whatever a client asks for.
inline constexpr std::int32_t kFewestRepetitions = 10;
inline constexpr std::int32_t kShortestInterval = 5;

class ActionServer;
class WorkQueue;
struct Platform;

/// Starts and stops test automation: one command line each, one alert each. Stops are
/// unconditional; a start while one runs starts a second. What a client gives as text stays text in the
/// command lines, which are carried out one after the other on a queue. Main thread only; the platform is
/// borrowed.
class Automation {
 public:
  explicit Automation(Platform& platform);
  ~Automation();

  void startVideoCalls(OptionalText sender, ActionServer& server);
  void stopVideoCalls(OptionalText sender, ActionServer& server);
  /// Only on an internal install. Reads "target", "interval" and "repetitions".
  void startMessaging(OptionalText sender, const ValueMap* userInfo, ActionServer& server);
  void stopMessaging(OptionalText sender, ActionServer& server);

 private:
  void _perform(const std::string& command);
  void _log(std::string_view what, std::string_view text);
  void _alert(const std::string& title, const std::string& message);

  Platform& _platform;
  const std::unique_ptr<WorkQueue> _commands;
};

}  // namespace zal
