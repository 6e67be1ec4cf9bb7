#pragma once

#include <memory>

#include "platform/agent_log.h"
#include "platform/clock.h"
#include "platform/ipc_peer.h"

namespace zal {

class SessionWritings;
class ZalLoggingAgentServer;

/// Every event of every peer: a dictionary becomes one row of the request table, a lost connection
/// is cancelled, the rest is at most logged under "IPC". Keeps no state between events and answers
/// nothing. An exception of a request is logged and costs that request alone. Main thread only.
///
///     listener->resume(onInvalid, MessageHandler(server, agentLog, clock));
class MessageHandler {
 public:
  /// Borrowed: all of them outlive the listener that calls this. With writings the barriers of a peer that
  /// ended a session wait for its files.
  MessageHandler(ZalLoggingAgentServer& server, AgentLog& agentLog, const Clock& clock,
                 SessionWritings* writings = nullptr)
      : _server(&server), _agentLog(&agentLog), _clock(&clock), _writings(writings) {}

  void operator()(const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) const;

 private:
  void _handleError(PeerConnection& peer, IpcError error) const;
  void _handleMessage(const std::shared_ptr<PeerConnection>& peer, const Message& message) const;

  ZalLoggingAgentServer* _server;
  AgentLog* _agentLog;
  const Clock* _clock;
  SessionWritings* _writings;
};

}  // namespace zal
