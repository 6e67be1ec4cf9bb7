#pragma once

#include <memory>
#include <optional>
#include <string>

#include <asio/posix/stream_descriptor.hpp>

#include "platform/ipc_listener.h"
#include "platform/linux/ipc/access_policy.h"
#include "platform/linux/ipc/ipc_context.h"
#include "platform/linux/ipc/listening_socket.h"
#include "platform/run_loop.h"

namespace zal {

/// The agent's door: lets in whom the access policy admits, closes on others with one warning each.
/// When the process is out of descriptors it says so once and looks again every second. At its end
/// the peers it let in are disconnected. Main thread only.
class UnixIpcListener final : public IpcListener {
 public:
  /// Listens at `path`, or on the passed descriptor if there is one.
  UnixIpcListener(std::shared_ptr<IpcContext> context, RunLoop& loop, std::string serviceName,
                  std::string path, Descriptor passed);
  ~UnixIpcListener() override;

  void resume(ErrorHandler onInvalid, PeerHandler onPeerEvent) override;

 private:
  [[nodiscard]] bool _listen(std::optional<gid_t> group);
  void _stopListening();
  void _awaitPeers();
  void _acceptTurn();
  void _admit(Descriptor socket);
  void _waitForDescriptors(int error);
  void _becomeInvalid(const std::string& trouble);

  std::shared_ptr<IpcContext> _context;
  RunLoop& _loop;
  std::string _serviceName;
  std::string _path;
  Descriptor _passed;
  ErrorHandler _onInvalid;
  AccessPolicy _access{std::nullopt};
  std::optional<ListeningSocket> _listening;
  std::optional<asio::posix::stream_descriptor> _readiness;  // watches _listening, does not own it
  bool _saidExhausted = false;
  ScopedTimer _retry;
  std::shared_ptr<UnixIpcListener*> _alive;  // last, so that callbacks find it gone first
};

}  // namespace zal
