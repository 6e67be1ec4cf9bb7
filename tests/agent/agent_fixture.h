#pragma once

#include <gtest/gtest.h>

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "agent/session_environment.h"
#include "agent/zal_logging_agent_server.h"
#include "collectors/collectors.h"
#include "tests/support/fake_platform.h"

namespace zal::testing {

/// A server on a fake host. `calls` is what it asked of the diagnostics behind it, one line each.
class AgentFixture : public ::testing::Test {
 protected:
  void switchOn(const std::string& key) { fake.preferences.stored[key] = true; }
  void switchOff(const std::string& key) { fake.preferences.stored.erase(key); }

  /// Makes the server; time stands still until advance().
  void create() {
    server = std::make_unique<ZalLoggingAgentServer>(fake.platform, sessions.services(), recordingHooks());
  }
  /// With call logging on, as most tests want it.
  void createLogging() {
    switchOn("CallLogging");
    create();
  }
  void advance(std::chrono::nanoseconds duration) { fake.host.advance(duration); }

  AgentHooks recordingHooks() {
    AgentHooks hooks;
    hooks.StartSessionCaptures = [this](std::uint64_t flags) {
      calls.push_back("StartSessionCaptures " + std::to_string(flags));
    };
    hooks.ForceNetworkDump = [this](const std::string& directory, bool includePing) {
      calls.push_back("ForceNetworkDump " + directory + (includePing ? " with ping" : " without ping"));
    };
    hooks.performAction = [this](const ActionRequest& request, ActionServer&) {
      calls.push_back("action " + std::to_string(request.action));
      if (onAction) onAction(request);
    };
    return hooks;
  }
  void recordCollection(const CollectionRequest& request) {
    calls.push_back("CollectServiceLogs " + request.service + " into " + request.destination + ", reason " +
                    request.reason.value_or("none") + (request.background ? ", background" : ", at once") +
                    ", flags " + std::to_string(request.flags));
  }

  [[nodiscard]] std::shared_ptr<ZalLoggingAgentVistelSession> session(const std::string& key) const {
    const auto found = server->sessions().find(key);
    return found != server->sessions().end() ? found->second : nullptr;
  }
  [[nodiscard]] std::vector<std::string> registeredKeys() const {
    std::vector<std::string> keys;
    for (const auto& [key, value] : server->sessions()) keys.push_back(key);
    return keys;
  }
  /// Has the files of sessions that have ended written.
  void writeSessions() {
    while (fake.queues.runNext("session.logs")) fake.host.drain();
  }
  /// A file below the report root once sessions are written; its whole text.
  [[nodiscard]] std::string report(const std::string& path) {
    writeSessions();
    return readFile(fake.configuration.roots.DiagnosticReportRoot + "/" + path);
  }

  FakePlatform fake;
  Collectors collectors{fake.platform};
  SessionEnvironment sessions{fake.platform, collectors,
                              [this](const CollectionRequest& request) { recordCollection(request); }};
  std::vector<std::string> calls;
  std::function<void(const ActionRequest&)> onAction;
  std::unique_ptr<ZalLoggingAgentServer> server;  // before the host goes
};

}  // namespace zal::testing
