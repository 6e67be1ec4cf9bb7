#pragma once

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <mutex>
#include <optional>
#include <string_view>
#include <thread>

#include "platform/client_channel.h"
#include "platform/linux/client_channel/agent_socket.h"
#include "platform/linux/client_channel/delivery_ledger.h"
#include "platform/linux/client_channel/frame_batch.h"
#include "platform/linux/client_channel/retry_delay.h"
#include "platform/linux/client_channel/wake_up.h"

namespace zal {

/// The channel with a queue. Callers encode on their own threads and append under a short lock; one
/// thread takes the whole queue at a time and writes it in large pieces:
///
///     callers ──append──> _queue ──swap──> _batch ──write──> socket
///
/// The thread sleeps until there is something; the first frame after a silence leaves at once.
/// After a write it pauses for kPause or until kLargeWrite has gathered, so that a caller who sends
/// one frame after another costs few system calls.
class UnixClientChannel final : public ClientChannel {
 public:
  static constexpr std::chrono::microseconds kPause{250};
  static constexpr std::size_t kLargeWrite = 64U << 10U;

  /// Throws std::system_error when the host gives no thread or descriptor.
  explicit UnixClientChannel(ClientChannelOptions options);
  ~UnixClientChannel() override;

  ClientOutcome send(std::span<const RequestField> fields) override;
  ClientOutcome ask(std::span<const RequestField> fields, std::uint64_t& token) override;
  ClientOutcome flush(std::chrono::milliseconds limit) override;
  ClientOutcome awaitReply(std::uint64_t token, std::chrono::milliseconds limit, ValueMap& reply) override;
  [[nodiscard]] ClientChannelStatus status() const override;
  [[nodiscard]] double now() const override;

 private:
  using Lock = std::unique_lock<std::mutex>;
  static constexpr std::size_t kNever = std::numeric_limits<std::size_t>::max();
  struct Sleep {
    bool writable = false;
    std::chrono::nanoseconds limit{-1};  // negative: until woken
  };

  // Callers.
  ClientOutcome _append(std::optional<std::string_view> frame, Lock& lock);
  [[nodiscard]] std::size_t _queuedBytes() const { return _queue.unwritten().size() + _batchBytes; }

  // The thread.
  void _run();
  bool _takeWork();
  void _connectWhenDue();
  void _write();
  void _read();
  void _handle(const Frame& frame);
  void _loseConnection();
  void _reportDropped();
  [[nodiscard]] Sleep _planSleep();
  void _sleep();

  const ClientChannelOptions _options;

  mutable std::mutex _mutex;  // guards from here …
  FrameBatch _queue;
  std::size_t _batchBytes = 0;   // of _batch, not written yet
  std::size_t _wakeAt = kNever;  // bytes in the queue that end the thread's sleep
  bool _hurry = false;           // somebody waits: connect and write now
  bool _stop = false;
  DeliveryLedger _ledger;
  std::uint64_t _dropsReported = 0;
  std::thread::id _ownThread;
  std::condition_variable _answered;  // … to here

  // The thread's own.
  FrameBatch _batch;
  AgentSocket _socket;
  RetryDelay _retry;
  std::chrono::steady_clock::time_point _connectedAt;
  std::chrono::steady_clock::time_point _lastWrite;
  std::chrono::steady_clock::time_point _lastReport;

  WakeUp _wakeUp;
  std::thread _thread;
};

}  // namespace zal
