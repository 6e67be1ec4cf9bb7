#include "platform/agent_log.h"
#include "session/metric_statistics.h"
#include "session/session_lines.h"
#include "session/signal_metrics.h"
#include "session/vistel_session.h"

namespace zal {

namespace {
constexpr std::string_view kOwnSender = "Lirra";
}  // namespace

std::vector<std::string> ZalLoggingAgentVistelSession::_storedMetrics() const {
  std::vector<std::string> names;
  names.reserve(_qualityMetrics.size());
  for (const auto& entry : _qualityMetrics) names.push_back(entry.first);
  return names;
}

std::vector<Number>& ZalLoggingAgentVistelSession::_metricsForKey(std::string_view name) {
  const auto found = _qualityMetrics.find(name);
  if (found != _qualityMetrics.end()) return found->second;
  return _qualityMetrics[std::string(name)];
}

void ZalLoggingAgentVistelSession::_addQualityMetric(const SessionEntry& entry) {
  if (!entry.text || !entry.value) return;
  const std::string_view shown = textOr(entry.sender, kNoSender);
  _beginUnlessActive(shown, entry.at);
  _metricsForKey(*entry.text).push_back(*entry.value);
  _logs.addQuality(metricLine(*entry.text, numberText(*entry.value), shown, _entryTime(entry.at)));
}

void ZalLoggingAgentVistelSession::_gatherQualityMetrics() {
  gatherSignalMetrics(
      _services.telephony, _services.networkStatus,
      [this, pulse = std::weak_ptr<bool>(_pulseIsOn)](const SignalMetricsSnapshot& snapshot) {
        // An answer that comes after the end would begin the session again.
        if (pulse.expired()) return;
        for (const auto& [name, value] : snapshot) {
          _accept({.kind = SessionEntryKind::sample, .text = name, .sender = kOwnSender, .value = value});
        }
      });
}

void ZalLoggingAgentVistelSession::_appendQualityMetrics() {
  for (const std::string& name : _storedMetrics()) {
    for (const std::string& line : statisticsBlock(name, statisticsOf(_metricsForKey(name)))) {
      if (_logDescriptions) _services.agentLog.notice(line);
      _logs.addQuality(line);
    }
  }
}

}  // namespace zal
