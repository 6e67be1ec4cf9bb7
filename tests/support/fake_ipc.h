#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "platform/ipc_listener.h"

namespace zal::testing {

/// A message from values; remembers the keys that were asked for, in order.
class FakeMessage : public Message {
 public:
  ~FakeMessage() override;
  FakeMessage() = default;
  FakeMessage(std::initializer_list<ValueMap::value_type> entries) : values(entries) {}

  ValueMap values;
  std::map<std::string, Number, std::less<>> codedNumbers;
  std::optional<std::uint64_t> token;
  std::string printable = "{a message}";
  mutable int descriptions = 0;
  mutable std::vector<std::string> readKeys;

  [[nodiscard]] std::optional<std::string_view> string(std::string_view key) const override {
    const auto* text = _find<std::string>(key);
    return text != nullptr ? std::optional<std::string_view>(*text) : std::nullopt;
  }
  [[nodiscard]] std::int64_t int64(std::string_view key) const override { return _orZero<std::int64_t>(key); }
  [[nodiscard]] std::uint64_t uint64(std::string_view key) const override {
    return _orZero<std::uint64_t>(key);
  }
  [[nodiscard]] double real(std::string_view key) const override { return _orZero<double>(key); }
  [[nodiscard]] std::optional<ValueMap> dictionary(std::string_view key) const override {
    const auto* map = _find<ValueMap>(key);
    return map != nullptr ? std::optional<ValueMap>(*map) : std::nullopt;
  }
  [[nodiscard]] std::optional<Number> codedNumber(std::string_view key) const override {
    readKeys.emplace_back(key);
    const auto found = codedNumbers.find(key);
    return found != codedNumbers.end() ? std::optional<Number>(found->second) : std::nullopt;
  }
  [[nodiscard]] std::string description() const override {
    ++descriptions;
    return printable;
  }
  [[nodiscard]] std::optional<std::uint64_t> replyToken() const override { return token; }

 private:
  template <class T>
  const T* _find(std::string_view key) const {
    readKeys.emplace_back(key);
    const auto found = values.find(key);
    return found != values.end() ? found->second.template as<T>() : nullptr;
  }
  template <class T>
  T _orZero(std::string_view key) const {
    const T* value = _find<T>(key);
    return value != nullptr ? *value : T{};
  }
};

class FakePeer : public PeerConnection {
 public:
  ~FakePeer() override;
  explicit FakePeer(pid_t processId = 4711) : _processId(processId) {}
  bool connected = true;
  std::weak_ptr<void> barrierHold;
  std::vector<std::pair<std::uint64_t, ValueMap>> replies;

  [[nodiscard]] pid_t processId() const override { return _processId; }
  [[nodiscard]] bool isConnected() const override { return connected; }
  bool sendReply(std::uint64_t replyToken, const ValueMap& reply) override {
    if (connected) replies.emplace_back(replyToken, reply);
    return connected;
  }
  [[nodiscard]] std::shared_ptr<void> holdBarriers() override {
    const auto hold = std::make_shared<int>();
    barrierHold = hold;
    return hold;
  }
  [[nodiscard]] bool holdsBarriers() const { return !barrierHold.expired(); }
  void cancel() override { connected = false; }

 private:
  pid_t _processId;
};

/// Hands out listeners through which the test plays the peers.
class FakeIpcService : public IpcService {
 public:
  ~FakeIpcService() override;
  std::vector<std::string> listenerNames;
  IpcListener::ErrorHandler onInvalid;
  PeerHandler onPeerEvent;  ///< empty until a listener was resumed

  [[nodiscard]] std::unique_ptr<IpcListener> makeListener(std::string serviceName) override {
    listenerNames.push_back(std::move(serviceName));
    return std::make_unique<Listener>(*this);
  }

 private:
  class Listener : public IpcListener {
   public:
    explicit Listener(FakeIpcService& owner) : _owner(owner) {}
    void resume(ErrorHandler invalid, PeerHandler peerEvent) override {
      _owner.onInvalid = std::move(invalid);
      _owner.onPeerEvent = std::move(peerEvent);
    }

   private:
    FakeIpcService& _owner;
  };
};

}  // namespace zal::testing
