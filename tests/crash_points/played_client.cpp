#include "tests/crash_points/played_client.h"

#include <chrono>
#include <exception>
#include <thread>
#include <utility>

namespace zal::testing {

PlayedClient::PlayedClient(std::string socketPath, std::function<bool()> agentHasEnded)
    : _socketPath(std::move(socketPath)), _agentHasEnded(std::move(agentHasEnded)) {}

bool PlayedClient::waitUntil(const std::function<bool()>& condition) const {
  while (!condition()) {
    if (_agentHasEnded()) return condition();
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  }
  return true;
}

bool PlayedClient::_connect() {
  return waitUntil([this] {
    if (_connection) return true;
    try {
      _connection = std::make_unique<RawClient>(_socketPath);
    } catch (const std::exception&) {
      return false;  // nobody listens yet
    }
    return true;
  });
}

bool PlayedClient::tell(const std::function<void(MessageBuilder&)>& message) {
  if (!_connect()) return false;
  if (_connection->send(message) && _connection->barrier()) return true;
  _connection.reset();
  return false;
}

}  // namespace zal::testing
