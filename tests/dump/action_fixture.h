#pragma once

#include <gtest/gtest.h>

#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "collectors/collectors.h"
#include "dump/action_dispatcher.h"
#include "dump/closing_stages.h"
#include "dump/log_compressor.h"
#include "dump/log_dump.h"
#include "dump/service_collection.h"
#include "platform/standard_path.h"
#include "session/session_services.h"
#include "tests/dump/recording_action_server.h"
#include "tests/support/fake_platform.h"

namespace zal::testing {

/// The dispatcher with everything behind it on a fake host, at 14:03:07 on 2024-05-02 in CEST. A
/// client asks for actions; nothing runs in the background before finish().
class ActionFixture : public ::testing::Test {
 protected:
  static constexpr const char* kTime = "2024-05-02 at 14-03-07 (CEST)";
  static constexpr std::uint64_t kToken = 77;

  /// As a client's message that expects a reply, on its connection.
  void perform(std::int64_t action, OptionalText session = "Vistel", const ValueMap& info = {}) {
    message.token = kToken;
    performWith(action, session, &info, &message);
  }
  void performWith(std::int64_t action, OptionalText session, const ValueMap* info, const Message* request) {
    dispatcher.performAction({.action = action,
                              .session = session,
                              .sender = "caller",
                              .peer = peer,
                              .request = request,
                              .userInfo = info},
                             server);
  }
  /// Lets all background work and its waits end.
  void finish() {
    for (int round = 0; round < 4; ++round) {
      fake.queues.runAll();
      fake.host.advance(std::chrono::seconds{5});
    }
    fake.queues.runAll();
  }
  void answerPrompt(int code, const Value& text) { fake.userAlerts.answer(0, {code, text}); }

  [[nodiscard]] std::vector<UserAlert> alerts() const {
    std::vector<UserAlert> found;
    for (const auto& posted : fake.userAlerts.posted) found.push_back(posted.alert);
    return found;
  }
  /// "IDENTIFIER | TITLE | MESSAGE" of each alert.
  [[nodiscard]] std::vector<std::string> alertTexts() const {
    std::vector<std::string> texts;
    for (const UserAlert& alert : alerts()) {
      texts.push_back(alert.identifier + " | " + alert.title + " | " + alert.message);
    }
    return texts;
  }
  [[nodiscard]] static ValueMap replyWithPath(const std::string& path) {
    return {{"action", std::int64_t{14}},
            {"replyResult", ValueMap{{"logPath", path}, {"replyAction", std::int64_t{14}}}}};
  }
  [[nodiscard]] static ValueMap replyWithoutPath() {
    return {{"action", std::int64_t{14}}, {"replyResult", ValueMap{{"replyAction", std::int64_t{14}}}}};
  }
  [[nodiscard]] static std::string receiverDirectory(const std::string& root) {
    return root + "/Vistel/" + kTime + " (Receiver)";
  }
  [[nodiscard]] std::vector<std::string> warnings() const {
    std::vector<std::string> found;
    for (const std::string& line : fake.agentLog.lines) {
      if (line.starts_with("warning: ")) found.push_back(line);
    }
    return found;
  }

  FakePlatform fake;
  Platform& platform = fake.platform;
  const std::string root =
      resolveAndStandardize(fake.configuration.roots.DiagnosticReportRoot, fake.home.path());
  Collectors collectors{platform};
  BuildInformationCache buildInformation;
  TimeZoneCache timeZone;
  SessionServices sessionServices{platform.clock,
                                  platform.mainLoop,
                                  platform.localNotifications,
                                  platform.agentLog,
                                  platform.telephony,
                                  platform.networkStatus,
                                  platform.deviceRegistry,
                                  platform.systemVersion,
                                  platform.files,
                                  collectors.commands,
                                  collectors.files,
                                  collectors.pings,
                                  platform.configuration.roots,
                                  platform.configuration.endpoints,
                                  buildInformation,
                                  timeZone};
  _LirraLogCompressor compressor{{platform.agentLog, platform.fileCopier, platform.files, platform.queues}};
  ClosingStages closing{{platform, collectors, compressor}};
  ServiceCollection collection{{platform, collectors, closing}};
  /// What a bug-report system would have been told: "DESCRIPTION | COMPONENT | VERSION | ARCHIVE".
  std::vector<std::string> reports;
  std::function<void()> onReport;
  LogDump logDump{{platform, collectors, sessionServices, collection, compressor},
                  [this](const std::optional<std::string>& description, const std::string& component,
                         const std::string& version, const std::vector<std::string>& archives) {
                    reports.push_back(description.value_or("(none)") + " | " + component + " | " + version +
                                      " | " + archives.at(0));
                    if (onReport) onReport();
                    return 0;
                  }};
  ActionDispatcher dispatcher{{platform, collectors, sessionServices, collection, compressor, logDump}};
  RecordingActionServer server;
  std::shared_ptr<FakePeer> fakePeer = std::make_shared<FakePeer>();
  std::shared_ptr<PeerConnection> peer = fakePeer;
  FakeMessage message;
};

}  // namespace zal::testing
