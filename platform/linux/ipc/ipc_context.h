#pragma once

#include <cstddef>
#include <functional>
#include <memory>
#include <unordered_set>

#include <asio/io_context.hpp>

#include "platform/agent_log.h"
#include "platform/clock.h"
#include "platform/configuration.h"
#include "platform/ipc_peer.h"
#include "platform/main_thread_check.h"
#include "platform/memory_ledger.h"

namespace zal {

class UnixPeerConnection;

/// Large, as the kernel's share of the work is per read and not per byte.
inline constexpr std::size_t kReadBufferSize = 256U << 10U;

/// What the peers of one service have in common. Shared with each peer, so that one which is kept
/// beyond the service's life has something to stand on; it is closed by then and touches none of the
/// borrowed parts. Main thread only.
struct IpcContext {
  IpcContext(asio::io_context& loop, AgentLog& agentLog, IpcSettings ipcSettings,
             std::function<void()> flushLogs, const std::function<void()>& keepWhatCame = {},
             MemoryLedger* memoryLedger = nullptr)
      : io(loop),
        log(agentLog),
        settings(std::move(ipcSettings)),
        flush(std::move(flushLogs)),
        confirm(keepWhatCame ? keepWhatCame : flush),
        memory(memoryLedger) {}

  asio::io_context& io;
  AgentLog& log;
  const IpcSettings settings;
  const std::function<void()> flush, confirm;
  MemoryLedger* const memory;                   // null: nobody has too much
  PeerHandler handler;                          // set once, before the first peer
  bool delivering = false;                      // from the listener's resume to its end
  std::function<void()> stopListening = [] {};  // by whoever listens
  std::unordered_set<std::shared_ptr<UnixPeerConnection>> peers;
  std::function<void()> showShares = [] {};  // to other processes, before a barrier is answered
  /// One for all peers: each is read, decoded and handled in one go. Not zeroed, so that a quiet
  /// agent's memory does not grow by what it never reads.
  const std::unique_ptr<char[]> readBuffer{new char[kReadBufferSize]};
  SteadyTime lastRead{};  // roughly
  MainThreadCheck mainThread;
};

}  // namespace zal
