#include "examples/loopback_call/call_reporter.h"

#include <stdexcept>
#include <utility>

namespace loopback {

CallReporter::CallReporter(std::string sender, std::string session) : _session(std::move(session)) {
  lirra_options options;
  lirra_options_init(&options);
  options.sender = sender.c_str();
  _agent = lirra_open(&options);
  if (_agent == nullptr) throw std::runtime_error("no place to look for the agent; set LIRRA_SOCKET");
}

CallReporter::~CallReporter() { lirra_close(_agent, 1000); }

void CallReporter::begin(const std::string& initiator, const std::string& recipient) {
  lirra_begin_session(_agent, _session.c_str(), LIRRA_BEGIN_INITIATOR, 0);
  lirra_initiator(_agent, _session.c_str(), initiator.c_str());
  lirra_receiver(_agent, _session.c_str(), recipient.c_str());
}

void CallReporter::checkpoint(const std::string& text) {
  lirra_checkpoint(_agent, _session.c_str(), text.c_str(), LIRRA_NOW);
}

void CallReporter::describe(const std::string& description, const std::string& log) {
  lirra_describe(_agent, _session.c_str(), description.c_str(), log.c_str(), LIRRA_NOW);
}

void CallReporter::info(const std::string& category, const std::string& text) {
  lirra_call_info(_agent, _session.c_str(), category.c_str(), text.c_str());
}

void CallReporter::quality(const std::string& category, const std::string& text) {
  lirra_call_quality(_agent, _session.c_str(), category.c_str(), text.c_str());
}

void CallReporter::metrics(const std::string& side, const MediaEndpoint& endpoint) {
  const ReceptionStatistics& seen = endpoint.statistics();
  if (const auto roundTrip = seen.roundTripMilliseconds()) {
    lirra_call_metric(_agent, _session.c_str(), (side + "-rtt-ms").c_str(), *roundTrip);
  }
  lirra_call_metric(_agent, _session.c_str(), (side + "-jitter-ms").c_str(), seen.jitterMilliseconds());
  lirra_call_metric(_agent, _session.c_str(), (side + "-loss-percent").c_str(), seen.lossPercent());
  lirra_call_metric_uint64(_agent, _session.c_str(), (side + "-packets-received").c_str(), seen.packets());
}

void CallReporter::collect(const std::string& category, const std::string& path) {
  lirra_add_log_file(_agent, _session.c_str(), category.c_str(), path.c_str());
}

void CallReporter::end() { lirra_end_session(_agent, _session.c_str()); }

std::string CallReporter::confirm(int timeoutMilliseconds) {
  const lirra_result result = lirra_flush(_agent, timeoutMilliseconds);
  return result == LIRRA_OK ? std::string() : lirra_result_text(result);
}

unsigned long long CallReporter::dropped() const {
  lirra_statistics statistics{};
  statistics.size = sizeof statistics;
  return lirra_status(_agent, &statistics) == LIRRA_OK ? statistics.dropped : 0;
}

}  // namespace loopback
