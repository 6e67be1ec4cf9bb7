// Client records on their way into the host logging facility.

#include "agent/zal_logging_agent_server.h"

namespace zal {

void ZalLoggingAgentServer::log(const AgentLogRecord& record) { _recordLine(record, ""); }

void ZalLoggingAgentServer::event(const AgentLogRecord& record) { _recordLine(record, "-Event"); }

void ZalLoggingAgentServer::_recordLine(const AgentLogRecord& record, std::string_view categorySuffix) {
  _mainThread.check("ZalLoggingAgentServer");
  if (isEmptyText(record.text)) return;
  const std::string_view text = *record.text;
  const std::string_view type = record.type.value_or("ZalLogging");
  const std::string_view sender = record.sender.value_or("(No Sender)");
  const std::string_view category = record.category.value_or("(No Category)");
  if (_switches.ConsoleOutputTorvik) _platform.agentLog.console(category, text);
  formatAgentLogLine(_line, sender, category, text);
  std::string_view lineCategory = type;
  if (!categorySuffix.empty()) lineCategory = _lineCategory.assign(type).append(categorySuffix);
  _platform.logFacility.record({.level = kAgentRecordLevel,
                                .type = type,
                                .category = lineCategory,
                                .processInformation = false,
                                .line = _line,
                                .time = record.time});
  _noteActivity();
}

}  // namespace zal
