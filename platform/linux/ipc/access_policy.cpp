#include "platform/linux/ipc/access_policy.h"

#include <grp.h>
#include <pwd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <vector>

namespace zal {
namespace {

constexpr std::size_t kLargestEntry = 1U << 20U;

/// Runs a getpw…_r or getgr…_r call with a growing buffer; the entry's fields point into `buffer`.
template <class Entry, class Call>
bool lookUp(Entry& entry, std::vector<char>& buffer, const Call& call) {
  for (buffer.resize(4096); buffer.size() <= kLargestEntry; buffer.resize(buffer.size() * 4)) {
    Entry* found = nullptr;
    const int error = call(&entry, buffer.data(), buffer.size(), &found);
    if (error != ERANGE) return found != nullptr;
  }
  return false;
}

bool isMember(uid_t user, gid_t group) {
  passwd entry{};
  std::vector<char> buffer;
  const bool known = lookUp(entry, buffer, [user](passwd* to, char* space, std::size_t size, passwd** found) {
    return ::getpwuid_r(user, to, space, size, found);
  });
  if (!known) return false;
  std::vector<gid_t> groups(64);
  auto count = static_cast<int>(groups.size());
  if (::getgrouplist(entry.pw_name, entry.pw_gid, groups.data(), &count) < 0) {
    groups.resize(static_cast<std::size_t>(std::max(count, 0)));
    if (::getgrouplist(entry.pw_name, entry.pw_gid, groups.data(), &count) < 0) return false;
  }
  groups.resize(static_cast<std::size_t>(count));
  return std::find(groups.begin(), groups.end(), group) != groups.end();
}

}  // namespace

std::optional<PeerCredentials> peerCredentials(int socket) {
  ucred credentials{};
  socklen_t size = sizeof credentials;
  if (::getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &credentials, &size) != 0) return std::nullopt;
  return PeerCredentials{credentials.pid, credentials.uid, credentials.gid};
}

std::optional<gid_t> groupIdentifier(const std::string& name) {
  if (name.empty()) return std::nullopt;
  group entry{};
  std::vector<char> buffer;
  const bool known = lookUp(entry, buffer, [&name](group* to, char* space, std::size_t size, group** found) {
    return ::getgrnam_r(name.c_str(), to, space, size, found);
  });
  return known ? std::optional(entry.gr_gid) : std::nullopt;
}

bool AccessPolicy::admits(const PeerCredentials& peer) const {
  if (peer.user == 0 || peer.user == ::geteuid()) return true;
  return _group && (peer.group == *_group || isMember(peer.user, *_group));
}

}  // namespace zal
