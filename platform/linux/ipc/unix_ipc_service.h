#pragma once

#include <functional>
#include <memory>
#include <string>

#include <asio/io_context.hpp>

#include "platform/agent_log.h"
#include "platform/configuration.h"
#include "platform/ipc_listener.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/ipc/client_shares_file.h"
#include "platform/linux/ipc/ipc_context.h"
#include "platform/run_loop.h"

namespace zal {

/// The IPC service on a Unix stream socket, in the frames of platform/linux/wire/frame.h. Main
/// thread only; the loop, its context and the log outlive it. Peers that somebody keeps longer are
/// disconnected at its end.
///
///     UnixIpcService ipc(loop.context(), loop, agentLog, {path, configuration.ipc, flushLogs});
///     auto listener = ipc.makeListener("com.vendel.lirra");
///     listener->resume(onInvalid, onPeerEvent);
class UnixIpcService final : public IpcService {
 public:
  struct Options {
    std::string path;  ///< of the socket; not used when a listening descriptor was passed
    IpcSettings settings;
    std::function<void()> flush;      ///< brings all that was logged into the files
    std::function<void()> confirm{};  ///< keeps all that came as safe as is promised, before each barrier's
                                      ///< answer; none: flush
    MemoryLedger* memory = nullptr;   ///< who has more than a share of it has to wait; null: nobody has
    std::string sharesPath{};         ///< where it is shown what clients have of it; empty: nowhere
  };

  /// Takes the descriptor that a service manager passed, and its variables out of the environment:
  /// make it before there are threads.
  UnixIpcService(asio::io_context& context, RunLoop& loop, AgentLog& log, Options options);
  ~UnixIpcService() override;

  [[nodiscard]] std::unique_ptr<IpcListener> makeListener(std::string serviceName) override;
  /// Delivers that error to every peer.
  void terminationImminent();
  /// Lets nobody in any more and gives up the socket with its file; for a process that ends without
  /// destructors. Peers stay connected.
  void stopListening();
  [[nodiscard]] std::size_t peerCount() const { return _context->peers.size(); }

 private:
  void _showShares();

  RunLoop& _loop;
  std::string _path;
  Descriptor _passed;
  std::shared_ptr<IpcContext> _context;
  ClientSharesFile _shares;
};

}  // namespace zal
