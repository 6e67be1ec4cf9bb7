#include "agent/request_table.h"

#include <array>
#include <optional>

#include "agent/zal_logging_agent_server.h"

namespace zal {
namespace {

void beginSession(const RequestContext& c) {
  const auto type = c.message.string("sessionType");
  const auto sender = c.message.string("sender");
  const auto beginFlags = c.message.int64("beginSessionFlags");
  const auto endFlags = c.message.int64("endSessionFlags");
  c.server.beginSession(type, sender, beginFlags, endFlags);
}

void endSession(const RequestContext& c) {
  const auto type = c.message.string("sessionType");
  const auto sender = c.message.string("sender");
  c.server.endSession(type, sender);
}

void checkpoint(const RequestContext& c) {
  const auto text = c.message.string("checkpoint");
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  const auto time = c.message.real("time");
  c.server.event({.text = text,
                  .level = 0,
                  .category = "",
                  .sender = sender,
                  .pid = c.peer->processId(),
                  .type = type,
                  .time = 0});
  c.server.noteCheckpoint(text, type, time, sender);
}

void description(const RequestContext& c) {
  const auto text = c.message.string("description");
  const auto log = c.message.string("logString");
  const auto type = c.message.string("sessionType");
  const auto sender = c.message.string("sender");
  double time = c.message.real("time");
  if (!(time >= kEarliestDescriptionTime)) time = secondsSinceEpoch(c.clock.wallNow());
  c.server.logDescription(text, log, type, sender, time);
  c.server.log({.text = log,
                .level = 0,
                .category = "Default",
                .sender = sender,
                .pid = c.peer->processId(),
                .type = type,
                .time = 0});
}

void callInfo(const RequestContext& c) {
  const auto category = c.message.string("category");
  const auto info = c.message.string("callInfo");
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  c.server.logCallInfo(info, category, type, sender);
}

void callQuality(const RequestContext& c) {
  const auto text = c.message.string("description");
  const auto log = c.message.string("logString");
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  c.server.logCallQuality(text, log, type, sender);
}

void callMetric(const RequestContext& c) {
  const auto text = c.message.string("description");
  const auto number = c.message.codedNumber("number");
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  c.server.addCallMetric(text, number, type, sender);
}

void pulse(const RequestContext& c) {
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  c.server.pulseForSession(type, sender);
}

void action(const RequestContext& c) {
  const auto code = c.message.int64("action");
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  c.server.performAction(code, type, sender, c.peer, &c.message, nullptr);
}

void actionWithUserInfo(const RequestContext& c) {
  const auto code = c.message.int64("action");
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  const auto userInfo = c.message.dictionary("userInfo");
  c.server.performAction(code, type, sender, c.peer, &c.message, userInfo ? &*userInfo : nullptr);
}

void sessionEvent(const RequestContext& c) {
  const auto event = c.message.int64("event");
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  c.server.noteEvent(event, type, sender);
}

void initiator(const RequestContext& c) {
  const auto identity = c.message.string("initiator");
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  c.server.noteInitiator(identity, type, sender);
}

void receiver(const RequestContext& c) {
  const auto identity = c.message.string("receiver");
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  c.server.noteReceiver(identity, type, sender);
}

void failureReason(const RequestContext& c) {
  const auto reason = c.message.string("failureReason");
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  c.server.noteFailureReason(reason, type, sender);
}

void addLogFile(const RequestContext& c) {
  const auto type = c.message.string("session");
  const auto sender = c.message.string("sender");
  const auto category = c.message.string("category");
  const auto path = c.message.string("path");
  c.server.addLogFile(path, type, sender, category);
}

/// Log and event records differ in the key of their text alone.
AgentLogRecord readRecord(const RequestContext& c, std::string_view textKey) {
  // In the order in which the keys lie in a message: that finds each at once.
  AgentLogRecord record;
  record.category = c.message.string("category");
  record.level = c.message.int64("level");
  record.text = c.message.string(textKey);
  record.sender = c.message.string("sender");
  record.time = c.message.uint64("time");
  record.type = c.message.string("type");
  record.pid = c.peer->processId();
  return record;
}

void logRecord(const RequestContext& c) { c.server.log(readRecord(c, "logString")); }

void eventRecord(const RequestContext& c) { c.server.event(readRecord(c, "eventString")); }

constexpr std::array kRequestTable = {
    RequestRow{"begin session", beginSession},                // 0
    RequestRow{"end session", endSession},                    // 1
    RequestRow{"checkpoint", checkpoint},                     // 2
    RequestRow{"description", description},                   // 3
    RequestRow{"call info", callInfo},                        // 4
    RequestRow{"call quality", callQuality},                  // 5
    RequestRow{"call metric", callMetric},                    // 6
    RequestRow{"pulse", pulse},                               // 7
    RequestRow{"action", action},                             // 8
    RequestRow{"action with user info", actionWithUserInfo},  // 9
    RequestRow{"session event", sessionEvent},                // 10
    RequestRow{"initiator", initiator},                       // 11
    RequestRow{"receiver", receiver},                         // 12
    RequestRow{"failure reason", failureReason},              // 13
    RequestRow{"add log file", addLogFile},                   // 14
    RequestRow{"log record", logRecord},                      // 15
    RequestRow{"event record", eventRecord},                  // 16
};

}  // namespace

std::span<const RequestRow> requestTable() { return kRequestTable; }

}  // namespace zal
