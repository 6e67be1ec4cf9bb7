#pragma once

#include <memory>

#include "platform/agent_log.h"
#include "platform/clock.h"
#include "platform/ipc_peer.h"

namespace zal {

class ZalLoggingAgentServer;

/// Every event of every peer: a dictionary becomes one row of the request table, a lost connection
/// is cancelled, the rest is at most logged under "IPC". Keeps no state between events and answers
/// nothing. An exception of a request is logged and costs that request alone. Main thread only.
///
///     listener->resume(onInvalid, MessageHandler(server, agentLog, clock));
class MessageHandler {
 public:
  /// Borrowed: all three outlive the listener that calls this.
  MessageHandler(ZalLoggingAgentServer& server, AgentLog& agentLog, const Clock& clock)
      : _server(&server), _agentLog(&agentLog), _clock(&clock) {}

  void operator()(const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) const;

 private:
  void _handleError(PeerConnection& peer, IpcError error) const;
  void _handleMessage(const std::shared_ptr<PeerConnection>& peer, const Message& message) const;

  ZalLoggingAgentServer* _server;
  AgentLog* _agentLog;
  const Clock* _clock;
};

}  // namespace zal
