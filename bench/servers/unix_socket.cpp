#include "bench/servers/unix_socket.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

namespace zal::bench {

UnixSocket::UnixSocket(Kind kind, const std::filesystem::path& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  const std::string name = path.string();
  if (name.size() >= sizeof address.sun_path) return;
  memcpy(address.sun_path, name.c_str(), name.size() + 1);
  _descriptor = socket(AF_UNIX, (kind == Kind::stream ? SOCK_STREAM : SOCK_DGRAM) | SOCK_CLOEXEC, 0);
  if (_descriptor >= 0 &&
      ::connect(_descriptor, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
    close(_descriptor);
    _descriptor = -1;
  }
}

UnixSocket::~UnixSocket() {
  if (_descriptor >= 0) close(_descriptor);
}

void UnixSocket::sendAll(std::string_view bytes) const {
  while (!bytes.empty()) {
    const ssize_t sent = ::send(_descriptor, bytes.data(), bytes.size(), MSG_NOSIGNAL);
    if (sent < 0 && errno == EINTR) continue;
    if (sent < 0) {
      fprintf(stderr, "a server under measurement hung up: %s\n", strerror(errno));
      exit(1);
    }
    bytes.remove_prefix(static_cast<std::size_t>(sent));
  }
}

}  // namespace zal::bench
