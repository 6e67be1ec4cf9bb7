#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <thread>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/ipc_peer.h"
#include "platform/linux/ipc/access_policy.h"
#include "platform/main_thread_check.h"
#include "platform/run_loop.h"

namespace zal {

/// One connection of the bus that may talk to the agent, with its calls that are not answered yet.
/// Main thread only.
class BusCaller final : public PeerConnection, public std::enable_shared_from_this<BusCaller> {
 public:
  /// `onCancel` runs once, when it ends by cancel().
  BusCaller(RunLoop& loop, const PeerCredentials& credentials, std::function<void()> onCancel);

  [[nodiscard]] pid_t processId() const override { return _credentials.process; }
  [[nodiscard]] bool isConnected() const override { return _isConnected; }
  bool sendReply(std::uint64_t replyToken, const ValueMap& reply) override;
  void cancel() override;

  /// Keeps the call open; the token names it.
  [[nodiscard]] std::uint64_t keep(sdbus::MethodCall call);
  [[nodiscard]] std::size_t openCalls() const { return _calls.size(); }
  /// This connection for the handler of that call. Who means to answer keeps it; once nobody does, the
  /// call is answered with an empty dictionary. May be dropped on any thread.
  [[nodiscard]] std::shared_ptr<PeerConnection> owing(std::uint64_t replyToken);

 private:
  class OwedAnswer;

  RunLoop& _loop;
  const PeerCredentials _credentials;
  std::function<void()> _onCancel;
  bool _isConnected = true;
  std::uint64_t _lastToken = 0;
  std::map<std::uint64_t, sdbus::MethodCall> _calls;
  MainThreadCheck _mainThread;
};

/// Answers with an error of the bus: for callers that are not let in. Nothing when none is expected.
void refuse(const sdbus::MethodCall& call, const char* errorName, const std::string& reason);

}  // namespace zal
