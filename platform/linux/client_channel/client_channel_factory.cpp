#include <pthread.h>
#include <unistd.h>

#include <atomic>
#include <cstdlib>
#include <mutex>
#include <utility>

#include "platform/client_channel.h"
#include "platform/linux/client_channel/synchronous_client_channel.h"
#include "platform/linux/client_channel/unix_client_channel.h"

namespace zal {
namespace {

/// Which process this is, counted in forks from the first; cheaper to ask than the process id.
std::atomic<std::uint64_t> forkGeneration{0};

std::uint64_t watchForks() {
  static std::once_flag once;
  std::call_once(once, [] { ::pthread_atfork(nullptr, nullptr, [] { ++forkGeneration; }); });
  return forkGeneration;
}

/// Keeps a forked child away from a channel whose locks and thread are its parent's.
class OneProcessChannel final : public ClientChannel {
 public:
  explicit OneProcessChannel(std::unique_ptr<ClientChannel> channel)
      : _generation(watchForks()), _channel(std::move(channel)) {}
  ~OneProcessChannel() override {
    if (!_isOurs()) (void)_channel.release();  // its locks may be held for ever: nothing can be freed
  }

  ClientOutcome send(std::span<const RequestField> fields) override {
    return _isOurs() ? _channel->send(fields) : _dropInChild();
  }
  ClientOutcome ask(std::span<const RequestField> fields, std::uint64_t& token) override {
    return _isOurs() ? _channel->ask(fields, token) : _dropInChild();
  }
  ClientOutcome flush(std::chrono::milliseconds limit) override {
    return _isOurs() ? _channel->flush(limit) : ClientOutcome::unreachable;
  }
  ClientOutcome awaitReply(std::uint64_t token, std::chrono::milliseconds limit, ValueMap& reply) override {
    return _isOurs() ? _channel->awaitReply(token, limit, reply) : ClientOutcome::lost;
  }
  [[nodiscard]] ClientChannelStatus status() const override {
    if (_isOurs()) return _channel->status();
    ClientChannelStatus status;
    status.dropped = _droppedInChild;
    status.trouble = "the handle belongs to the parent process";
    return status;
  }
  [[nodiscard]] double now() const override { return _channel->now(); }

 private:
  [[nodiscard]] bool _isOurs() const { return forkGeneration.load(std::memory_order_relaxed) == _generation; }
  ClientOutcome _dropInChild() {
    ++_droppedInChild;
    return ClientOutcome::dropped;
  }

  std::uint64_t _generation;
  std::unique_ptr<ClientChannel> _channel;
  std::atomic<std::uint64_t> _droppedInChild{0};
};

}  // namespace

std::unique_ptr<ClientChannel> openClientChannel(ClientChannelOptions options) {
  std::unique_ptr<ClientChannel> channel;
  if (options.synchronous) {
    channel = std::make_unique<SynchronousClientChannel>(std::move(options));
  } else {
    channel = std::make_unique<UnixClientChannel>(std::move(options));
  }
  return std::make_unique<OneProcessChannel>(std::move(channel));
}

std::string agentAddress() {
  const char* named = ::secure_getenv("LIRRA_SOCKET");
  if (named != nullptr && *named != '\0') return named;
  const char* runtime = ::secure_getenv("XDG_RUNTIME_DIR");
  if (runtime != nullptr && *runtime == '/') {
    std::string directory = runtime;
    while (directory.size() > 1 && directory.back() == '/') directory.pop_back();
    return directory + (directory == "/" ? "" : "/") + "com.vendel.lirra";
  }
  return ::geteuid() == 0 ? "/run/com.vendel.lirra" : "";
}

}  // namespace zal
