// One function per kind of request: which keys it has, and of which type.

#include "client/lirra_handle.h"

using lirra::EventCode;
using lirra::guarded;
using lirra::Request;

namespace {

/// begin, end and description name the session differently from all others; the protocol wants it so.
constexpr std::string_view kSessionType = "sessionType";
constexpr std::string_view kSession = "session";

template <class Fill>
lirra_result post(lirra_handle* handle, EventCode code, Fill&& fill) {
  if (handle == nullptr) return LIRRA_INVALID;
  return guarded([&] {
    Request request(code, handle->sender);
    fill(request);
    return lirra::resultOf(handle->channel->send(request.fields()));
  });
}

double timeOrNow(const lirra_handle* handle, double time) { return time < 0 ? handle->channel->now() : time; }

lirra_result postMetric(lirra_handle* handle, const char* session, const char* metric, zal::Number value) {
  return post(handle, EventCode::callMetric, [&](Request& request) {
    request.text("description", metric).add("number", value).text(kSession, session);
  });
}

lirra_result postText(lirra_handle* handle, EventCode code, const char* session, std::string_view key,
                      const char* text) {
  return post(handle, code, [&](Request& request) { request.text(key, text).text(kSession, session); });
}

lirra_result postRecord(lirra_handle* handle, EventCode code, std::string_view textKey, const char* type,
                        const char* category, int64_t level, uint64_t time, const char* text) {
  return post(handle, code, [&](Request& request) {
    request.text(textKey, text).add("level", level).add("time", time);
    request.text("category", category).text("type", type);
  });
}

void fillAction(Request& request, const char* session, int64_t action, const lirra_dictionary* info) {
  request.add("action", action).text(kSession, session);
  if (info != nullptr) request.add("userInfo", &info->values);
}

EventCode actionCode(const lirra_dictionary* info) {
  return info != nullptr ? EventCode::actionWithInfo : EventCode::action;
}

}  // namespace

extern "C" {

lirra_result lirra_begin_session(lirra_handle* handle, const char* session, int64_t begin_flags,
                                 int64_t end_flags) {
  return post(handle, EventCode::beginSession, [&](Request& request) {
    request.text(kSessionType, session)
        .add("beginSessionFlags", begin_flags)
        .add("endSessionFlags", end_flags);
  });
}

lirra_result lirra_end_session(lirra_handle* handle, const char* session) {
  return post(handle, EventCode::endSession, [&](Request& request) { request.text(kSessionType, session); });
}

lirra_result lirra_checkpoint(lirra_handle* handle, const char* session, const char* checkpoint,
                              double time) {
  return post(handle, EventCode::checkpoint, [&](Request& request) {
    request.text("checkpoint", checkpoint).text(kSession, session).add("time", timeOrNow(handle, time));
  });
}

lirra_result lirra_describe(lirra_handle* handle, const char* session, const char* description,
                            const char* log, double time) {
  return post(handle, EventCode::description, [&](Request& request) {
    request.text("description", description).text("logString", log).text(kSessionType, session);
    request.add("time", timeOrNow(handle, time));
  });
}

lirra_result lirra_call_info(lirra_handle* handle, const char* session, const char* category,
                             const char* info) {
  return post(handle, EventCode::callInfo, [&](Request& request) {
    request.text("category", category).text("callInfo", info).text(kSession, session);
  });
}

lirra_result lirra_call_quality(lirra_handle* handle, const char* session, const char* description,
                                const char* log) {
  return post(handle, EventCode::callQuality, [&](Request& request) {
    request.text("description", description).text("logString", log).text(kSession, session);
  });
}

lirra_result lirra_call_metric(lirra_handle* handle, const char* session, const char* metric, double value) {
  return postMetric(handle, session, metric, value);
}

lirra_result lirra_call_metric_int64(lirra_handle* handle, const char* session, const char* metric,
                                     int64_t value) {
  return postMetric(handle, session, metric, std::int64_t{value});
}

lirra_result lirra_call_metric_uint64(lirra_handle* handle, const char* session, const char* metric,
                                      uint64_t value) {
  return postMetric(handle, session, metric, std::uint64_t{value});
}

lirra_result lirra_pulse(lirra_handle* handle, const char* session) {
  return post(handle, EventCode::pulse, [&](Request& request) { request.text(kSession, session); });
}

lirra_result lirra_session_event(lirra_handle* handle, const char* session, int64_t event) {
  return post(handle, EventCode::sessionEvent,
              [&](Request& request) { request.add("event", event).text(kSession, session); });
}

lirra_result lirra_initiator(lirra_handle* handle, const char* session, const char* initiator) {
  return postText(handle, EventCode::initiator, session, "initiator", initiator);
}

lirra_result lirra_receiver(lirra_handle* handle, const char* session, const char* receiver) {
  return postText(handle, EventCode::receiver, session, "receiver", receiver);
}

lirra_result lirra_failure_reason(lirra_handle* handle, const char* session, const char* reason) {
  return postText(handle, EventCode::failureReason, session, "failureReason", reason);
}

lirra_result lirra_add_log_file(lirra_handle* handle, const char* session, const char* category,
                                const char* path) {
  return post(handle, EventCode::addLogFile, [&](Request& request) {
    request.text(kSession, session).text("category", category).text("path", path);
  });
}

lirra_result lirra_log(lirra_handle* handle, const char* type, const char* category, int64_t level,
                       uint64_t time, const char* text) {
  return postRecord(handle, EventCode::logRecord, "logString", type, category, level, time, text);
}

lirra_result lirra_event(lirra_handle* handle, const char* type, const char* category, int64_t level,
                         uint64_t time, const char* text) {
  return postRecord(handle, EventCode::eventRecord, "eventString", type, category, level, time, text);
}

lirra_result lirra_action(lirra_handle* handle, const char* session, int64_t action) {
  return lirra_action_with_info(handle, session, action, nullptr);
}

lirra_result lirra_action_with_info(lirra_handle* handle, const char* session, int64_t action,
                                    const lirra_dictionary* info) {
  return post(handle, actionCode(info),
              [&](Request& request) { fillAction(request, session, action, info); });
}

lirra_result lirra_action_ask(lirra_handle* handle, const char* session, int64_t action,
                              const lirra_dictionary* info, uint64_t* ticket) {
  if (handle == nullptr || ticket == nullptr) return LIRRA_INVALID;
  *ticket = 0;
  return guarded([&] {
    Request request(actionCode(info), handle->sender);
    fillAction(request, session, action, info);
    return lirra::resultOf(handle->channel->ask(request.fields(), *ticket));
  });
}

}  // extern "C"
