#pragma once

#include <sys/types.h>

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <variant>

#include "platform/value.h"

namespace zal {

/// One key of a request. Borrowed: text and dictionary need live only until the call returns. A
/// Number travels as a coded value, everything else as the plain type it is.
struct RequestField {
  using Content =
      std::variant<std::string_view, std::int64_t, std::uint64_t, double, Number, const ValueMap*>;
  std::string_view key;
  Content content;
};

enum class ClientOutcome {
  done,
  dropped,      ///< the queue has no room; counted
  tooLarge,     ///< no agent would take it, or it is larger than the whole queue; counted as dropped
  unreachable,  ///< nobody answers at the agent's address
  timedOut,
  lost,  ///< the connection broke after requests were written and before the agent confirmed them
};

class ClientChannel;

struct ClientChannelOptions {
  std::string address;                            ///< of the agent's service
  std::size_t queueLimit = 4U << 20U;             ///< bytes
  std::uint32_t largestRequest = 16U << 20U;      ///< encoded bytes; what the agent takes by default
  std::chrono::milliseconds firstRetry{100};      ///< doubled at each failure in a row …
  std::chrono::milliseconds longestRetry{5'000};  ///< … up to this
  /// No queue and no thread: each request is one write in the calling thread, which may wait for
  /// the agent, but not longer than `writeLimit`.
  bool synchronous = false;
  std::chrono::milliseconds writeLimit{5'000};
  /// Called on the channel's own thread when there is room again after requests were dropped, with
  /// how many; it may send. Returned: whether that count is now reported.
  std::function<bool(ClientChannel&, std::uint64_t dropped)> roomAgain;
};

struct ClientChannelStatus {
  bool connected = false;
  pid_t agent = 0;              ///< process that answers, from the kernel; 0 when not connected
  std::size_t queuedBytes = 0;  ///< accepted and not yet written
  std::uint64_t sent = 0;       ///< requests wholly written
  std::uint64_t sentBytes = 0;
  std::uint64_t writes = 0;  ///< in how many pieces
  std::uint64_t dropped = 0;
  std::uint64_t unconfirmed = 0;  ///< written to connections that broke before a flush covered them
  std::uint64_t connections = 0;  ///< made so far
  std::string trouble;            ///< why the last connection failed or ended; empty: none did
};

/// A client's road to the agent. Any thread may call; requests of one thread keep their order, and
/// a request is sent whole or not at all. Nothing is started, and no connection is made before
/// there is something to send, so that an idle client never wakes an agent that has idled out.
///
/// A request that a broken connection had taken in part is sent again, whole, on the next one. What
/// it had taken whole may never have been read: only a flush answers that. Dies with what is
/// queued; flush first.
///
/// After fork() the child must open a channel of its own. In the child this one drops every
/// request, answers `unreachable`, and its end touches nothing of the parent's.
class ClientChannel {
 public:
  virtual ~ClientChannel() = default;
  ClientChannel() = default;
  ClientChannel(const ClientChannel&) = delete;
  ClientChannel& operator=(const ClientChannel&) = delete;

  /// Accepts one request; never waits (see `synchronous`). Returned: done, dropped or tooLarge, and
  /// unreachable only when synchronous.
  virtual ClientOutcome send(std::span<const RequestField> fields) = 0;
  /// The same for a request whose sender wants the agent's reply, which the token then names. At
  /// most kMostAsked may be open; one more is dropped.
  virtual ClientOutcome ask(std::span<const RequestField> fields, std::uint64_t& token) = 0;
  static constexpr std::size_t kMostAsked = 64;

  /// Waits until the agent has handled everything accepted before. Tries at once to connect, and
  /// is `unreachable` at once when that fails; `lost` when something written since the flush before
  /// went down with a connection.
  virtual ClientOutcome flush(std::chrono::milliseconds limit) = 0;
  /// Waits for a reply, which may then be taken once. Timed out: it can be awaited again. Lost:
  /// the connection broke, or the token names nothing.
  virtual ClientOutcome awaitReply(std::uint64_t token, std::chrono::milliseconds limit, ValueMap& reply) = 0;
  [[nodiscard]] virtual ClientChannelStatus status() const = 0;
  /// The wall clock, seconds since 1970: for requests that bring no time of their own.
  [[nodiscard]] virtual double now() const = 0;
};

/// The host's channel; throws only when the host gives no memory, thread or descriptor. An agent that
/// is not there shows in the outcomes.
[[nodiscard]] std::unique_ptr<ClientChannel> openClientChannel(ClientChannelOptions options);
/// Where the agent of this user listens: $LIRRA_SOCKET, else com.vendel.lirra in $XDG_RUNTIME_DIR,
/// else in /run for the superuser; empty when no rule gives a place.
[[nodiscard]] std::string agentAddress();

}  // namespace zal
