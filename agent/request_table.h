#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <string_view>

#include "platform/clock.h"
#include "platform/ipc_peer.h"

namespace zal {

class ZalLoggingAgentServer;

inline constexpr std::string_view kEventCodeKey = "__ipc__event_code__";

/// What carrying out one request needs. Borrowed for the call.
struct RequestContext {
  ZalLoggingAgentServer& server;
  const Clock& clock;
  const std::shared_ptr<PeerConnection>& peer;
  const Message& message;
};

struct RequestRow {
  std::string_view name;
  /// Reads the keys of the request in their order and calls its server operations. What is absent
  /// is passed on as absent.
  void (*carryOut)(const RequestContext& context);
};

/// All requests; the index is the event code.
[[nodiscard]] std::span<const RequestRow> requestTable();

/// A client time that cannot be one: below 100 seconds after 1970 (or no number at all) means that
/// the client had no clock to ask.
inline constexpr double kEarliestDescriptionTime = 100.0;

}  // namespace zal
