#pragma once

#include <chrono>
#include <mutex>
#include <string_view>

#include "platform/client_channel.h"
#include "platform/linux/client_channel/agent_socket.h"
#include "platform/linux/client_channel/delivery_ledger.h"
#include "platform/linux/client_channel/retry_delay.h"

namespace zal {

/// The channel without queue and thread: each request is one write by its caller, who waits for the
/// agent when the socket is full. Callers take turns; one that waits for an answer keeps the others
/// waiting.
class SynchronousClientChannel final : public ClientChannel {
 public:
  explicit SynchronousClientChannel(ClientChannelOptions options);

  ClientOutcome send(std::span<const RequestField> fields) override;
  ClientOutcome ask(std::span<const RequestField> fields, std::uint64_t& token) override;
  ClientOutcome flush(std::chrono::milliseconds limit) override;
  ClientOutcome awaitReply(std::uint64_t token, std::chrono::milliseconds limit, ValueMap& reply) override;
  [[nodiscard]] ClientChannelStatus status() const override;
  [[nodiscard]] double now() const override;

 private:
  using Moment = std::chrono::steady_clock::time_point;
  enum class Written { whole, broken, late };

  ClientOutcome _sendRequest(std::string_view frame);
  [[nodiscard]] bool _connect(Moment deadline, bool atOnce);
  ClientOutcome _writeFrame(std::string_view frame, Moment deadline, bool atOnce);
  [[nodiscard]] Written _writeWhole(std::string_view frame, Moment deadline);
  void _readUntilAnswered(std::uint64_t cookie, Moment deadline);
  void _loseConnection(const std::string& trouble);

  const ClientChannelOptions _options;
  mutable std::mutex _mutex;  // guards all below
  AgentSocket _socket;
  RetryDelay _retry;
  DeliveryLedger _ledger;
};

}  // namespace zal
