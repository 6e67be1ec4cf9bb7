#include <optional>
#include <utility>

#include "session/device_model.h"
#include "session/header_lines.h"
#include "session/reference_time.h"
#include "session/session_lines.h"
#include "session/vistel_session.h"

namespace zal {

std::optional<std::string> ZalLoggingAgentVistelSession::model() {
  if (!_model) _model = deviceModel(_services.deviceRegistry);
  return _model;
}

void ZalLoggingAgentVistelSession::_addHeaderLine(OptionalText label, OptionalText value) {
  if (auto line = headerLine(label, value)) _header->add(std::move(*line));
}

void ZalLoggingAgentVistelSession::_addTimeInformation() {
  _addHeaderLine("Time", "Separator");
  // Waits for a command, which may take long.
  _header->addAnswer([&commands = _services.commandRunner, directory = _services.roots.TemporaryRoot] {
    return headerLine("Reference Time", referenceTime(commands, directory));
  });
}

void ZalLoggingAgentVistelSession::_addCallInfoInformation() {
  for (std::size_t item = 0; item < _callInfoCategories.size(); ++item) {
    _addHeaderLine(_callInfoCategories[item], _callInfoStrings[item]);
  }
}

void ZalLoggingAgentVistelSession::_addBuildInformation() {
  BuildInformationCache& build = _services.buildInformation;
  build.refill(_services.systemVersion, [this] { return model(); });
  _addHeaderLine("Build Version", build.buildVersion());
  _addHeaderLine("Device", build.deviceModel());
  _addHeaderLine("Product Version", build.osVersion());
  _addHeaderLine("Product Name", build.osName());
}

void ZalLoggingAgentVistelSession::_addFailureInformation() {
  _addHeaderLine("Failure Reason", failureReason());
}

void ZalLoggingAgentVistelSession::_addRecipientInformation() { _addHeaderLine("Recipient ID", recipient()); }

void ZalLoggingAgentVistelSession::_addInitiatorInformation() { _addHeaderLine("Initiator ID", initiator()); }

}  // namespace zal
