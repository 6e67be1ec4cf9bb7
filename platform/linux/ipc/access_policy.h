#pragma once

#include <sys/types.h>

#include <optional>
#include <string>

namespace zal {

/// Who stands at the other end of a connection, as the kernel noted when it was made.
struct PeerCredentials {
  pid_t process = 0;
  uid_t user = 0;
  gid_t group = 0;
};

/// Nothing when the descriptor is no connected Unix socket.
[[nodiscard]] std::optional<PeerCredentials> peerCredentials(int socket);

/// The id of a group by its name; nothing for an empty or unknown one.
[[nodiscard]] std::optional<gid_t> groupIdentifier(const std::string& name);

/// Who may talk to the agent: the superuser, the agent's own user, and members of one group.
class AccessPolicy {
 public:
  explicit AccessPolicy(std::optional<gid_t> group) : _group(group) {}
  /// Reads the user and group tables, so that a change of membership counts from the next
  /// connection on.
  [[nodiscard]] bool admits(const PeerCredentials& peer) const;

 private:
  std::optional<gid_t> _group;
};

}  // namespace zal
