#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "collectors/command_runner.h"
#include "collectors/file_collector.h"
#include "collectors/ping_runner.h"
#include "session/vistel_session.h"
#include "tests/support/fake_platform.h"

namespace zal::testing {

/// A session "Vistel" on a fake host. It is 14:03:07.251 on 2024-05-02 in CEST.
class SessionFixture : public ::testing::Test {
 protected:
  /// The same moment, as clients send times.
  static constexpr double kNow = 1714651387.251;

  FakePlatform fakes;
  ManualRunLoop& host = fakes.host;
  CommandRunner commandRunner{fakes.shell, fakes.files, fakes.agentLog};
  FileCollector fileCollector{fakes.files, fakes.agentLog, fakes.configuration.roots};
  _ZalLoggingAgentPingRunner pingRunner{fakes.queues, fakes.pings, fakes.agentLog};
  BuildInformationCache buildInformation;
  TimeZoneCache timeZone;
  std::vector<CollectionRequest> collections;
  SessionServices services{fakes.host,
                           fakes.host,
                           fakes.localNotifications,
                           fakes.agentLog,
                           fakes.telephony,
                           fakes.networkStatus,
                           fakes.deviceRegistry,
                           fakes.systemVersion,
                           fakes.files,
                           commandRunner,
                           fileCollector,
                           pingRunner,
                           fakes.configuration.roots,
                           fakes.configuration.endpoints,
                           buildInformation,
                           timeZone,
                           [this](const CollectionRequest& request) { collections.push_back(request); }};
  std::string base = fakes.home / "Logs/Reports/Vistel";
  std::shared_ptr<ZalLoggingAgentVistelSession> session = makeSession();

  std::shared_ptr<ZalLoggingAgentVistelSession> makeSession() {
    return std::make_shared<ZalLoggingAgentVistelSession>("Vistel", base, services);
  }
  /// Checkpoints "1", "2" ... at this moment: with begin and end, four lines are enough to be written.
  void noteCheckpoints(int count) {
    for (int number = 1; number <= count; ++number) {
      session->noteCheckpoint(std::to_string(number), kNow, "caller");
    }
  }
  std::string receiverDirectory = base + "/2024-05-02 at 14-03-07 (CEST) (Receiver)";
  std::string simpleLog() { return readFile(receiverDirectory + "/Log (14-03-07).log"); }
  std::string verboseLog() { return readFile(receiverDirectory + "/Verbose Log (14-03-07).log"); }
  std::string qualityLog() { return readFile(receiverDirectory + "/Quality Log (14-03-07).log"); }
};

}  // namespace zal::testing
