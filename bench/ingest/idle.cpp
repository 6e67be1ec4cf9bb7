#include "bench/ingest/idle.h"

#include <memory>

#include "bench/servers/agent_server.h"
#include "bench/support/process_figures.h"
#include "bench/support/scratch_folder.h"
#include "bench/support/timing.h"

namespace zal::bench {

struct IdleWatch::State {
  explicit State(const std::filesystem::path& programs) : server(programs, AgentClients::oneRecordAWrite) {}
  ScratchFolder folder;
  AgentServer server;
  std::unique_ptr<RecordSender> client;
  std::string missing;
  std::uint64_t before = 0;
  Stopwatch since;
};

IdleWatch::IdleWatch(const std::filesystem::path& programs) : _state(new State(programs)) {
  _state->missing = _state->server.start(_state->folder.path());
  if (!_state->missing.empty()) return;
  if (!_state->server.warmUp()) _state->missing = "the agent stores nothing";
  _state->client = _state->server.connect(1);
  _state->client->send(1);
  pauseMilliseconds(5000);  // three seconds after its start it looks at the disk, once
  _state->before = contextSwitches(_state->server.processId());
  _state->since = Stopwatch();
}

IdleWatch::~IdleWatch() { delete _state; }

const std::string& IdleWatch::missing() const { return _state->missing; }

std::uint64_t IdleWatch::switchesAfter(double seconds) {
  while (_state->since.seconds() < seconds) pauseMilliseconds(50);
  return contextSwitches(_state->server.processId()) - _state->before;
}

}  // namespace zal::bench
