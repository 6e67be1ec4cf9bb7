#pragma once

#include <string>
#include <vector>

#include "dump/action_server.h"

namespace zal::testing {

/// A server that keeps what actions ask of it, one line each.
class RecordingActionServer : public ActionServer {
 public:
  std::vector<std::string> calls;
  void notePoorNetworkConditions() override { calls.emplace_back("poor network"); }
  void startPing(OptionalText sessionType, bool useWifi) override {
    calls.push_back("ping " + std::string(sessionType.value_or("(none)")) +
                    (useWifi ? " Wi-Fi" : " cellular"));
  }
  void setAutomationRunning(bool running) override {
    calls.emplace_back(running ? "automation runs" : "automation stopped");
  }
  void userNotificationDidFinish() override { calls.emplace_back("alert finished"); }
};

}  // namespace zal::testing
