#include "bench/bus/session_cost.h"

#include <fstream>
#include <stdexcept>

#include "bench/servers/agent_server.h"
#include "bench/servers/unix_socket.h"
#include "bench/support/process_figures.h"

namespace zal::bench {
namespace {

constexpr long kSettle =
    1000;  // milliseconds: a start, or the loading of a module, is not what a session costs

ChildProcess::Options optionsOf(const std::filesystem::path& programs, const std::filesystem::path& folder,
                                const std::string& bus) {
  ChildProcess::Options options = AgentServer::options(programs, folder, 1U << 30U);
  std::ofstream(folder / "com.vendel.logging.toml") << "CallLogging = true\n";
  const std::string nowhere = "unix:path=" + (folder / "no-bus").string();
  options.environment.push_back("DBUS_SYSTEM_BUS_ADDRESS=" + (bus.empty() ? nowhere : bus));
  options.environment.push_back("DBUS_SESSION_BUS_ADDRESS=" + nowhere);
  return options;
}

}  // namespace

IdleSession::IdleSession(const std::filesystem::path& programs, const std::string& bus)
    : _agent(optionsOf(programs, _folder.path(), bus)),
      _client({.socketPath = AgentServer::socketIn(_folder.path()).string(), .sender = "bench"}) {
  if (!waitUntil(10, [&] { return UnixSocket(UnixSocket::Kind::stream, socketPath()).connected(); }))
    throw std::runtime_error("the agent does not start");
  pauseMilliseconds(kSettle);
  _cost.atRest = residentMebibytes(_agent.id());
  _client.beginSession("Vistel");
  _client.checkpoint("Vistel", "Connected");
  if (_client.flush(10'000) != LIRRA_OK) throw std::runtime_error("the agent begins no session");
  pauseMilliseconds(kSettle);
  _cpuBefore = cpuSeconds(_agent.id());
  _since = Stopwatch();
}

std::string IdleSession::socketPath() const { return AgentServer::socketIn(_folder.path()).string(); }

SessionCost IdleSession::costAfter(double seconds) {
  while (_since.seconds() < seconds) pauseMilliseconds(50);
  _cost.cpuSecondsAnHour = (cpuSeconds(_agent.id()) - _cpuBefore) * 3600 / _since.seconds();
  _cost.inSession = residentMebibytes(_agent.id());
  return _cost;
}

}  // namespace zal::bench
