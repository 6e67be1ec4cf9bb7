#include "client/lirra_handle.h"

#include <algorithm>
#include <chrono>
#include <cstring>

namespace lirra {
namespace {

std::chrono::milliseconds limitOf(int timeoutMs) { return std::chrono::milliseconds(std::max(timeoutMs, 0)); }

/// Tells the agent's log what it did not get.
bool reportDropped(zal::ClientChannel& channel, std::uint64_t dropped,
                   const std::optional<std::string>& sender) {
  const std::string text =
      std::to_string(dropped) +
      " requests of this client were dropped, for want of room in its queue or for their size";
  Request request(EventCode::logRecord, sender);
  request.add("logString", std::string_view(text))
      .add("level", std::int64_t{0})
      .add("time", std::uint64_t{0});
  request.text("category", "Client");
  return channel.send(request.fields()) == zal::ClientOutcome::done;
}

zal::ClientChannelOptions channelOptions(const lirra_options& options,
                                         const std::optional<std::string>& sender) {
  zal::ClientChannelOptions result;
  result.address = options.socket_path != nullptr ? options.socket_path : zal::agentAddress();
  if (options.queue_limit != 0) result.queueLimit = options.queue_limit;
  result.synchronous = options.synchronous != 0;
  result.roomAgain = [sender](zal::ClientChannel& channel, std::uint64_t dropped) {
    return reportDropped(channel, dropped, sender);
  };
  return result;
}

}  // namespace

lirra_result resultOf(zal::ClientOutcome outcome) {
  switch (outcome) {
    case zal::ClientOutcome::done:
      return LIRRA_OK;
    case zal::ClientOutcome::dropped:
      return LIRRA_DROPPED;
    case zal::ClientOutcome::tooLarge:
      return LIRRA_TOO_LARGE;
    case zal::ClientOutcome::unreachable:
      return LIRRA_UNREACHABLE;
    case zal::ClientOutcome::timedOut:
      return LIRRA_TIMEOUT;
    case zal::ClientOutcome::lost:
      return LIRRA_LOST;
  }
  return LIRRA_INVALID;
}

}  // namespace lirra

using lirra::guarded;

extern "C" {

const char* lirra_version(void) { return LIRRA_VERSION; }

const char* lirra_result_text(lirra_result result) {
  switch (result) {
    case LIRRA_OK:
      return "done";
    case LIRRA_DROPPED:
      return "dropped: no room in the queue";
    case LIRRA_TOO_LARGE:
      return "dropped: too large";
    case LIRRA_UNREACHABLE:
      return "the agent cannot be reached";
    case LIRRA_TIMEOUT:
      return "not within the given time";
    case LIRRA_LOST:
      return "the connection broke before the agent confirmed";
    case LIRRA_INVALID:
      return "invalid arguments";
    case LIRRA_ABSENT:
      return "no such key of this type";
  }
  return "unknown result";
}

void lirra_options_init(lirra_options* options) {
  if (options == nullptr) return;
  *options = lirra_options{};
  options->size = sizeof *options;
}

lirra_handle* lirra_open(const lirra_options* options) {
  lirra_options own;
  lirra_options_init(&own);
  // A program that was built with fewer options than this library knows gets defaults for the rest.
  if (options != nullptr) std::memcpy(&own, options, std::min(options->size, sizeof own));
  try {
    auto handle = std::make_unique<lirra_handle>();
    if (own.sender != nullptr) handle->sender = own.sender;
    zal::ClientChannelOptions channel = lirra::channelOptions(own, handle->sender);
    if (channel.address.empty()) return nullptr;
    handle->channel = zal::openClientChannel(std::move(channel));
    return handle.release();
  } catch (...) {
    return nullptr;
  }
}

lirra_result lirra_close(lirra_handle* handle, int timeout_ms) {
  if (handle == nullptr) return LIRRA_INVALID;
  const lirra_result result = lirra_flush(handle, timeout_ms);
  delete handle;
  return result;
}

lirra_result lirra_flush(lirra_handle* handle, int timeout_ms) {
  if (handle == nullptr) return LIRRA_INVALID;
  return guarded([&] { return lirra::resultOf(handle->channel->flush(lirra::limitOf(timeout_ms))); });
}

lirra_result lirra_status(lirra_handle* handle, lirra_statistics* statistics) {
  if (handle == nullptr || statistics == nullptr || statistics->size < sizeof statistics->size)
    return LIRRA_INVALID;
  return guarded([&] {
    const zal::ClientChannelStatus status = handle->channel->status();
    const lirra_statistics own{
        statistics->size, status.connected ? 1 : 0, status.agent,       status.queuedBytes, status.sent,
        status.sentBytes, status.dropped,           status.unconfirmed, status.connections};
    std::memcpy(statistics, &own, std::min(own.size, sizeof own));
    return LIRRA_OK;
  });
}

size_t lirra_trouble(lirra_handle* handle, char* buffer, size_t size) {
  if (handle == nullptr || (buffer == nullptr && size != 0)) return 0;
  if (size != 0) *buffer = '\0';
  try {
    const std::string trouble = handle->channel->status().trouble;
    if (size != 0) {
      const std::size_t kept = std::min(trouble.size(), size - 1);
      std::memcpy(buffer, trouble.data(), kept);
      buffer[kept] = '\0';
    }
    return trouble.size();
  } catch (...) {
    return 0;
  }
}

lirra_result lirra_action_wait(lirra_handle* handle, uint64_t ticket, int timeout_ms,
                               lirra_dictionary** reply) {
  if (handle == nullptr || reply == nullptr) return LIRRA_INVALID;
  *reply = nullptr;
  return guarded([&] {
    auto dictionary = std::make_unique<lirra_dictionary>();
    const auto outcome = handle->channel->awaitReply(ticket, lirra::limitOf(timeout_ms), dictionary->values);
    if (outcome == zal::ClientOutcome::done) *reply = dictionary.release();
    return lirra::resultOf(outcome);
  });
}

}  // extern "C"
