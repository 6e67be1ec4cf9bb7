#include "tests/e2e/bus/knocking_client.h"

#include <chrono>

#include "tests/e2e/raw_client.h"

namespace zal::testing {

KnockingClient::KnockingClient(const std::string& socketPath)
    : _thread([this, socketPath] { _knock(socketPath); }) {}

KnockingClient::~KnockingClient() {
  _stop = true;
  _thread.join();
}

void KnockingClient::_knock(const std::string& socketPath) {
  RawClient client(socketPath);
  while (!_stop && client.barrier()) {
    ++_answers;
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
  }
}

}  // namespace zal::testing
