#include "bench/ingest/session_agent.h"

#include <fstream>
#include <utility>

#include "bench/servers/agent_server.h"
#include "bench/servers/record_text.h"
#include "bench/servers/unix_socket.h"
#include "bench/support/timing.h"

namespace zal::bench {
namespace {

constexpr const char* kSession = "Bench";
constexpr unsigned kEntriesBetweenLooks = 1024;
constexpr std::uint64_t kFullSendQueue = 3U << 20U;

void waitForRoom(lirra_handle* client) {
  lirra_statistics statistics;
  statistics.size = sizeof statistics;
  while (lirra_status(client, &statistics) == LIRRA_OK && statistics.queued_bytes > kFullSendQueue) {
    pauseMicroseconds(200);
  }
}

ChildProcess::Options optionsWith(const std::filesystem::path& programs, const std::filesystem::path& folder,
                                  const std::string& settings) {
  ChildProcess::Options options = AgentServer::options(programs, folder, 1U << 30U);
  std::ofstream(folder / "lirra.toml", std::ios::app) << settings;
  std::ofstream(folder / "com.vendel.logging.toml") << "CallLogging = true\n";
  return options;
}

}  // namespace

SessionAgent::SessionAgent(const std::filesystem::path& programs, const std::string& settings)
    : _options(optionsWith(programs, _folder.path(), settings)),
      _agent(_options),
      _socket(AgentServer::socketIn(_folder.path()).string()) {
  if (!_listensWithin(10)) {
    _missing = "the agent does not start";
    return;
  }
  lirra_options client;
  lirra_options_init(&client);
  client.socket_path = _socket.c_str();
  client.sender = "callservice";
  _client = lirra_open(&client);
  lirra_begin_session(_client, kSession, 0, 0);
  if (lirra_flush(_client, 10'000) != LIRRA_OK) _missing = "the session did not begin";
}

SessionAgent::~SessionAgent() {
  if (_client != nullptr) lirra_close(_client, 0);
}

std::string SessionAgent::send(std::uint64_t entries) {
  std::string text = RecordText(0).text();
  const std::size_t position = numberPosition(text);
  for (std::uint64_t number = 0; number < entries; ++number) {
    if (number % kEntriesBetweenLooks == 0) waitForRoom(_client);
    putNumber(text, position, number);
    const double time = 1.7e9 + 0.001 * static_cast<double>(number);
    if (lirra_describe(_client, kSession, "Transport", text.c_str(), time) != LIRRA_OK)
      return "an entry was refused";
  }
  return lirra_flush(_client, 60'000) == LIRRA_OK ? "" : "the barrier was not answered";
}

bool SessionAgent::_listensWithin(double seconds) const {
  return waitUntil(seconds, [&] { return UnixSocket(UnixSocket::Kind::stream, _socket).connected(); });
}

std::string SessionAgent::cutOff() {
  lirra_close(std::exchange(_client, nullptr), 0);
  _agent.kill();
  _agent = ChildProcess(_options);
  constexpr double kLongestRecovery = 600;
  return _listensWithin(kLongestRecovery) ? "" : "the agent does not start again";
}

void SessionAgent::endSession() { lirra_end_session(_client, kSession); }

}  // namespace zal::bench
