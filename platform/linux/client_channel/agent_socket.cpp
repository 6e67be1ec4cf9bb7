#include "platform/linux/client_channel/agent_socket.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <system_error>

namespace zal {
namespace {

/// Room for a burst of records; the kernel cuts it to what it allows a plain user.
constexpr int kSendBuffer = 1 << 20;

std::string errorText(int error) { return std::generic_category().message(error); }

}  // namespace

AgentSocket::Attempt AgentSocket::connect(const std::string& path) {
  close();
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.empty() || path.size() >= sizeof address.sun_path) {
    _trouble =
        path.empty() ? "no place to look for the agent is known" : path + ": too long for a socket's path";
    return Attempt::refused;
  }
  std::memcpy(address.sun_path, path.data(), path.size());

  _descriptor = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
  if (_descriptor < 0) {
    _trouble = "no socket: " + errorText(errno);
    return Attempt::refused;
  }
  ::setsockopt(_descriptor, SOL_SOCKET, SO_SNDBUF, &kSendBuffer, sizeof kSendBuffer);
  if (::connect(_descriptor, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
    const int error = errno;
    _fail(path + ": " + errorText(error));
    return error == EAGAIN || error == EINTR ? Attempt::busy : Attempt::refused;
  }
  ucred credentials{};
  socklen_t size = sizeof credentials;
  if (::getsockopt(_descriptor, SOL_SOCKET, SO_PEERCRED, &credentials, &size) == 0) _agent = credentials.pid;
  _decoder = FrameDecoder();
  return Attempt::connected;
}

void AgentSocket::close() {
  if (_descriptor < 0) return;
  ::shutdown(_descriptor, SHUT_WR);
  ::close(_descriptor);
  _descriptor = -1;
  _agent = 0;
}

std::optional<std::size_t> AgentSocket::write(std::string_view bytes) {
  for (;;) {
    const ssize_t written = ::send(_descriptor, bytes.data(), bytes.size(), MSG_NOSIGNAL | MSG_DONTWAIT);
    if (written >= 0) return static_cast<std::size_t>(written);
    if (errno == EAGAIN || errno == ENOBUFS) return 0;
    if (errno == EINTR) continue;
    _trouble = "writing to the agent: " + errorText(errno);
    return std::nullopt;
  }
}

bool AgentSocket::read(const std::function<void(const Frame&)>& handle) {
  std::array<char, 16384> buffer;
  while (isOpen()) {
    const ssize_t count = ::recv(_descriptor, buffer.data(), buffer.size(), MSG_DONTWAIT);
    if (count < 0 && errno == EINTR) continue;
    if (count < 0 && errno == EAGAIN) return true;
    if (count < 0) return _fail("reading from the agent: " + errorText(errno));
    if (count == 0) return _fail("the agent closed the connection");
    _decoder.feed({buffer.data(), static_cast<std::size_t>(count)});
    while (const auto frame = _decoder.next()) handle(*frame);
    if (_decoder.failed()) return _fail("the agent's answer makes no sense: " + _decoder.failure());
    if (static_cast<std::size_t>(count) < buffer.size()) return true;
  }
  return false;
}

bool AgentSocket::_fail(std::string trouble) {
  _trouble = std::move(trouble);
  close();
  return false;
}

}  // namespace zal
