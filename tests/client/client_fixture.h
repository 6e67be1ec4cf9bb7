#pragma once

#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "client/lirra.hpp"
#include "tests/client_support/scripted_agent.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// A client library's handle and an agent for it, both at a socket of their own.
class ClientFixture : public ::testing::Test {
 protected:
  using Behaviour = ScriptedAgent::Behaviour;
  static constexpr int kPatienceMs = 10'000;

  void startAgent() { agent = std::make_unique<ScriptedAgent>(socketPath()); }
  void stopAgent() { agent.reset(); }
  [[nodiscard]] std::string socketPath() const { return directory / "agent"; }

  [[nodiscard]] lirra::Client open(std::size_t queueLimit = 0, bool synchronous = false) const {
    lirra::Client::Options options;
    options.socketPath = socketPath();
    options.sender = "tester";
    options.queueLimit = queueLimit;
    options.synchronous = synchronous;
    options.closeTimeoutMs = 0;
    return lirra::Client(options);
  }

  TemporaryDirectory directory;
  std::unique_ptr<ScriptedAgent> agent;
};

}  // namespace zal::testing
