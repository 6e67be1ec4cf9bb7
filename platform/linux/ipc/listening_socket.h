#pragma once

#include <sys/types.h>

#include <optional>
#include <string>

#include "platform/linux/files/descriptor.h"

namespace zal {

/// A Unix stream socket that listens, and the file it is reached by. Removes the file at its end if
/// it is still its own.
///
/// Two agents that start at once cannot both win: who binds first takes a lock on "<path>.lock" and
/// keeps it for life. The lock file stays; the kernel gives up the lock of a killed agent.
class ListeningSocket {
 public:
  /// Binds `path` with mode 0660 and, where possible, the group. A file left by a killed agent is
  /// replaced. Returned in `trouble` when it cannot be had: why, and which process holds it.
  [[nodiscard]] static std::optional<ListeningSocket> bindPath(const std::string& path,
                                                               std::optional<gid_t> group,
                                                               std::string& trouble);
  /// Takes over a descriptor that somebody else bound, who keeps its file.
  [[nodiscard]] static std::optional<ListeningSocket> adopt(Descriptor passed, std::string& trouble);

  ListeningSocket(ListeningSocket&& other) noexcept;
  ListeningSocket& operator=(ListeningSocket&&) = delete;
  ~ListeningSocket();

  [[nodiscard]] int descriptor() const { return _socket.get(); }

 private:
  ListeningSocket() = default;

  Descriptor _lock;
  Descriptor _socket;
  std::string _path;  // empty: not ours to remove
  dev_t _device = 0;
  ino_t _inode = 0;
};

/// The first descriptor that the service manager passed to this very process (LISTEN_PID,
/// LISTEN_FDS), closed on exec from now on; those beyond it are closed. Nothing when none was passed.
/// Takes the variables out of the environment: call it before other threads read that.
[[nodiscard]] Descriptor takePassedListener();

}  // namespace zal
