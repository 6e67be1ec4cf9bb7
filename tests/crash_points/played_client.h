#pragma once

#include <functional>
#include <memory>
#include <string>

#include "tests/e2e/raw_client.h"

namespace zal::testing {

/// A client that sends one thing at a time and asks after each whether it is safe. It connects again when
/// its connection ends, and gives up when the agent has.
class PlayedClient {
 public:
  PlayedClient(std::string socketPath, std::function<bool()> agentHasEnded);

  /// Whether the agent confirmed it. What was not confirmed is not sent again: it may have come nevertheless.
  bool tell(const std::function<void(MessageBuilder&)>& message);
  /// Asks with short waits until it holds; false when the agent ends before.
  bool waitUntil(const std::function<bool()>& condition) const;

 private:
  bool _connect();

  std::string _socketPath;
  std::function<bool()> _agentHasEnded;
  std::unique_ptr<RawClient> _connection;
};

}  // namespace zal::testing
