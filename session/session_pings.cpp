#include "collectors/ping_runner.h"
#include "session/ping_requests.h"
#include "session/vistel_session.h"

namespace zal {

void ZalLoggingAgentVistelSession::startPing(bool useWifi) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  const std::string directory = _services.roots.TemporaryRoot + "/";
  const LocalTime now = _services.clock.localTime(_services.clock.wallNow());
  for (const SessionPing& ping : sessionPings(useWifi, _services.endpoints, now)) {
    _services.pingRunner.addPingTest(ping.address, kSessionPingSeconds, ping.useWifi, directory,
                                     ping.fileName);
    addLogFile(directory + ping.fileName, std::nullopt, "Ping");
  }
}

}  // namespace zal
