#include "dump/automation.h"

#include <algorithm>

#include "dump/action_server.h"
#include "dump/shell_word.h"
#include "dump/user_info.h"
#include "platform/platform.h"
#include "platform/standard_path.h"
#include "session/collected_files.h"
#include "session/session_lines.h"

namespace zal {
namespace {

constexpr const char* kAutomationTitle = "Vistel Automation";
constexpr const char* kMessaging = "Quillet Automation";
constexpr const char* kNoTarget = "Not starting automation, no target was specified";

std::string callStressCommand(const std::string& reportRoot) {
  return "/usr/bin/nohup /usr/local/etc/runnelUI/general/callstress.js >> " +
         shellPath(reportRoot + "/CallRunLog.txt") + " &";
}

std::string messagingTestCommand(const std::string& target, std::int32_t repetitions, std::int32_t interval) {
  return "/usr/bin/nohup /usr/local/bin/zaltool -w automation-test -s Quillet -h " + shellWord(target) +
         " -t " + std::to_string(std::max(repetitions, kFewestRepetitions)) + " -i " +
         std::to_string(std::max(interval, kShortestInterval)) + " -d 400 &";
}

/// Up to a NUL, which no command line can hold.
std::string targetOf(const ValueMap* userInfo) {
  const std::string target = textOf(userInfo, "target").value_or("");
  return target.substr(0, target.find('\0'));
}

}  // namespace

Automation::Automation(Platform& platform)
    : _platform(platform), _commands(platform.queues.makeSerial("automation")) {}

Automation::~Automation() = default;

void Automation::startVideoCalls(OptionalText sender, ActionServer& server) {
  _log("Starting automation on behalf of: ", textOr(sender, kNoSender));
  _perform(callStressCommand(resolveAndStandardize(_platform.configuration.roots.DiagnosticReportRoot,
                                                   _platform.files.homeDirectory())));
  server.setAutomationRunning(true);
  _alert(kAutomationTitle, "Started Vistel automation");
}

void Automation::stopVideoCalls(OptionalText sender, ActionServer& server) {
  _log("Stopping automation on behalf of: ", textOr(sender, kNoSender));
  _perform("/usr/bin/killall -9 runnel");
  server.setAutomationRunning(false);
  _alert(kAutomationTitle, "Stopped Vistel automation");
}

void Automation::startMessaging(OptionalText sender, const ValueMap* userInfo, ActionServer& server) {
  if (!_platform.configuration.internalInstall) return;
  _log("Starting Quillet automation on behalf of: ", textOr(sender, kNoSender));
  const std::string target = targetOf(userInfo);
  if (target.empty()) {
    _alert(kMessaging, kNoTarget);
    return;
  }
  const std::string command =
      messagingTestCommand(target, integerOf(userInfo, "repetitions"), integerOf(userInfo, "interval"));
  _log("Starting zaltool automation: ", command);
  _perform(command);
  server.setAutomationRunning(true);
  _alert(kMessaging, "Starting Quillet automation with: " + target);
}

void Automation::stopMessaging(OptionalText sender, ActionServer& server) {
  _log("Stopping Quillet automation on behalf of: ", textOr(sender, kNoSender));
  _perform("/usr/bin/killall -9 zaltool");
  server.setAutomationRunning(false);
  _alert(kMessaging, "Stopped Quillet automation");
}

void Automation::_perform(const std::string& command) {
  _commands->async([&shell = _platform.shell, command] { shell.PerformSystem(command); });
}

void Automation::_log(std::string_view what, std::string_view text) {
  _platform.agentLog.log("Automation", std::string(what) + printable(text));
}

void Automation::_alert(const std::string& title, const std::string& message) {
  UserAlert alert;
  alert.identifier = "Automation";
  alert.title = title;
  alert.message = message;
  alert.defaultButton = "OK";
  _platform.userAlerts.post(std::move(alert), {});
}

}  // namespace zal
