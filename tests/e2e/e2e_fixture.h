#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "tests/e2e/agent_process.h"
#include "tests/e2e/agent_sandbox.h"
#include "tests/e2e/raw_client.h"

namespace zal::testing {

/// One sandbox with the real daemon in it. At the end no sanitizer may have complained.
class E2eFixture : public ::testing::Test {
 protected:
  void start(AgentProcess::Options options = {}) {
    sandbox.writeConfiguration();
    agent = std::make_unique<AgentProcess>(sandbox, std::move(options));
  }
  [[nodiscard]] std::string output() const { return readFile(sandbox.outputFile()); }

  void TearDown() override {
    agent.reset();
    const std::string text = output();
    for (const char* complaint : {"Sanitizer", "runtime error:"}) {
      EXPECT_EQ(text.find(complaint), std::string::npos) << text;
    }
    if (HasFailure()) std::fprintf(stderr, "The agent said:\n%s", text.c_str());
  }

  AgentSandbox sandbox;
  std::unique_ptr<AgentProcess> agent;
};

}  // namespace zal::testing
