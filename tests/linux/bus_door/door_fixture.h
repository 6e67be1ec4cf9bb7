#pragma once

#include <chrono>
#include <functional>
#include <future>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <variant>
#include <vector>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/linux/bus/door/named_door.h"
#include "tests/linux/bus/bus_fixture.h"

namespace zal::testing {

using Dictionary = std::map<std::string, sdbus::Variant>;

/// What a call came to: its dictionary, or the name of an error.
struct CallResult {
  Dictionary reply;
  std::string error;
};

/// Somebody else on the bus, with a connection and a thread of its own.
class BusVisitor {
 public:
  explicit BusVisitor(const std::string& address)
      : _bus(sdbus::createSessionBusConnectionWithAddress(address)),
        _proxy(sdbus::createProxy(*_bus, "com.vendel.lirra", "/com/vendel/lirra")) {
    _bus->enterEventLoopAsync();
  }

  [[nodiscard]] std::future<CallResult> call(const Dictionary& request) {
    auto result = std::make_shared<std::promise<CallResult>>();
    _proxy->callMethodAsync("Request")
        .onInterface("com.vendel.Lirra")
        .withTimeout(std::chrono::seconds(60))
        .withArguments(request)
        .uponReplyInvoke([result](const sdbus::Error* error, const Dictionary& reply) {
          result->set_value({reply, error != nullptr ? error->getName() : ""});
        });
    return result->get_future();
  }
  void callWithoutReply(const Dictionary& request) {
    _proxy->callMethod("Request").onInterface("com.vendel.Lirra").withArguments(request).dontExpectReply();
  }
  [[nodiscard]] std::string name() const { return _bus->getUniqueName(); }

 private:
  std::unique_ptr<sdbus::IConnection> _bus;
  std::unique_ptr<sdbus::IProxy> _proxy;
};

/// The door on a real bus, with a handler that notes what it is given.
class DoorFixture : public BusFixture {
 protected:
  struct Event {
    std::shared_ptr<PeerConnection> peer;
    std::string text;  // a message's description, or the error
    std::optional<std::uint64_t> token;
  };
  using Lines = std::vector<std::string>;

  BusConnection connection{host, host.systemBus, "system bus"};
  std::unique_ptr<NamedDoor> door = std::make_unique<NamedDoor>(host, connection, "system bus");
  std::vector<Event> events;
  bool keepsPeers = false;  // who is kept is owed an answer
  std::function<void(const Message&)> onMessage = [](const Message&) {};

  void open() {
    door->open([this](const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) {
      if (const auto* error = std::get_if<IpcError>(&event)) {
        events.push_back({nullptr, "error " + std::to_string(static_cast<int>(*error)), std::nullopt});
        if (*error == IpcError::connectionInvalid) peer->cancel();
        return;
      }
      const Message& message = **std::get_if<const Message*>(&event);
      events.push_back({keepsPeers ? peer : nullptr, message.description(), message.replyToken()});
      onMessage(message);
    });
    ASSERT_TRUE(runUntil([this] { return bus.hasOwner("com.vendel.lirra"); }));
  }

  CallResult resultOf(std::future<CallResult> future) {
    const bool isThere =
        runUntil([&] { return future.wait_for(std::chrono::seconds(0)) == std::future_status::ready; });
    return isThere ? future.get() : CallResult{{}, "no answer"};
  }
  /// Runs the loop while a program runs; what it printed.
  std::string outputWhileServing(const std::vector<std::string>& words) {
    auto output = std::async(std::launch::async, [words] { return outputOf(words); });
    EXPECT_TRUE(
        runUntil([&] { return output.wait_for(std::chrono::seconds(0)) == std::future_status::ready; }));
    return output.get();
  }
  [[nodiscard]] std::vector<std::string> busctlWords(const std::vector<std::string>& request) const {
    std::vector<std::string> words{"busctl",
                                   "--address=" + bus.address(),
                                   "call",
                                   "com.vendel.lirra",
                                   "/com/vendel/lirra",
                                   "com.vendel.Lirra",
                                   "Request",
                                   "a{sv}"};
    words.insert(words.end(), request.begin(), request.end());
    return words;
  }
  [[nodiscard]] std::vector<std::string> busctlProgram(const std::vector<std::string>& request) const {
    std::vector<std::string> command = busctlWords(request);
    command.insert(command.begin(), "/usr/bin/env");
    return command;
  }
  [[nodiscard]] Lines texts() const {
    Lines result;
    for (const Event& event : events) result.push_back(event.text);
    return result;
  }
};

}  // namespace zal::testing
