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

void ZalLoggingAgentVistelSession::_addQualityMetric(OptionalText name, std::optional<Number> value,
                                                     OptionalText sender) {
  if (!name || !value) return;
  _metricsForKey(*name).push_back(*value);
  const std::string_view shown = textOr(sender, kNoSender);
  _beginUnlessActive(shown);
  _qualityLogs.append(metricLine(*name, numberText(*value), shown, _entryTime(_services.clock.wallNow())));
}

void ZalLoggingAgentVistelSession::_gatherQualityMetrics() {
  gatherSignalMetrics(_services.telephony, _services.networkStatus,
                      [this, pulse = std::weak_ptr<bool>(_pulseIsOn)](const SignalMetricsSnapshot& snapshot) {
                        // An answer that comes after the end would begin the session again.
                        if (pulse.expired()) return;
                        for (const auto& [name, value] : snapshot) _addQualityMetric(name, value, kOwnSender);
                      });
}

void ZalLoggingAgentVistelSession::_appendQualityMetrics() {
  for (const std::string& name : _storedMetrics()) {
    for (const std::string& line : statisticsBlock(name, statisticsOf(_metricsForKey(name)))) {
      if (_logDescriptions) _services.agentLog.notice(line);
      _qualityLogs.append(line);
    }
  }
}

}  // namespace zal
