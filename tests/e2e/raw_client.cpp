#include "tests/e2e/raw_client.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <stdexcept>

namespace zal::testing {
namespace {

int connectTo(const std::string& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.size() >= sizeof address.sun_path) throw std::runtime_error("socket path too long: " + path);
  std::memcpy(address.sun_path, path.c_str(), path.size() + 1);
  const int socket = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  if (::connect(socket, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
    ::close(socket);
    return -1;
  }
  return socket;
}

}  // namespace

RawClient::RawClient(const std::string& socketPath) : _socket(connectTo(socketPath)) {
  if (_socket < 0) throw std::runtime_error("nobody listens at " + socketPath);
}

RawClient::~RawClient() { ::close(_socket); }

bool RawClient::canConnect(const std::string& socketPath) {
  const int socket = connectTo(socketPath);
  if (socket >= 0) ::close(socket);
  return socket >= 0;
}

bool RawClient::sendBytes(std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t sent = ::send(_socket, bytes.data(), bytes.size(), MSG_NOSIGNAL);
    if (sent < 0 && errno == EINTR) continue;
    if (sent <= 0) return false;
    bytes.remove_prefix(static_cast<std::size_t>(sent));
  }
  return true;
}

bool RawClient::send(const std::function<void(MessageBuilder&)>& fill) {
  fill(_builder);
  _buffer.clear();
  _builder.finish(_buffer, FrameKind::message, 0);
  return sendBytes(_buffer);
}

bool RawClient::sendLog(const std::string& type, const std::string& text) {
  return send([&](MessageBuilder& message) {
    message.setInt64("__ipc__event_code__", 15);
    message.setString("logString", text);
    message.setString("sender", "test");
    message.setString("category", "e2e");
    message.setString("type", type);
  });
}

bool RawClient::beginSession(const std::string& type, std::int64_t flags) {
  return send([&](MessageBuilder& message) {
    message.setInt64("__ipc__event_code__", 0);
    message.setString("sessionType", type);
    message.setString("sender", "test");
    message.setInt64("beginSessionFlags", flags);
  });
}

bool RawClient::endSession(const std::string& type) {
  return send([&](MessageBuilder& message) {
    message.setInt64("__ipc__event_code__", 1);
    message.setString("sessionType", type);
    message.setString("sender", "test");
  });
}

bool RawClient::sendCheckpoint(const std::string& type, const std::string& text, double time) {
  return send([&](MessageBuilder& message) {
    message.setInt64("__ipc__event_code__", 2);
    message.setString("checkpoint", text);
    message.setString("session", type);
    message.setString("sender", "test");
    message.setReal("time", time);
  });
}

bool RawClient::sendDescription(const std::string& type, const std::string& log, double time) {
  return send([&](MessageBuilder& message) {
    message.setInt64("__ipc__event_code__", 3);
    message.setString("logString", log);
    message.setString("sessionType", type);
    message.setString("sender", "test");
    message.setReal("time", time);
  });
}

void RawClient::appendBarrier(std::string& bytes, std::uint64_t cookie) {
  FrameHeader header;
  header.kind = FrameKind::barrier;
  header.cookie = cookie;
  appendFrame(bytes, header, {});
}

std::optional<FrameHeader> RawClient::receive() {
  for (;;) {
    if (const auto frame = _decoder.next()) return frame->header;
    pollfd readable{_socket, POLLIN, 0};
    const auto deadline = std::chrono::duration_cast<std::chrono::milliseconds>(kDeadline);
    if (::poll(&readable, 1, static_cast<int>(deadline.count())) != 1) return std::nullopt;
    _received.resize(std::size_t{1} << 16U);
    const ssize_t count = ::recv(_socket, _received.data(), _received.size(), 0);
    if (count <= 0) return std::nullopt;
    _decoder.feed(std::string_view(_received).substr(0, static_cast<std::size_t>(count)));
  }
}

bool RawClient::barrier() {
  std::string bytes;
  const std::uint64_t cookie = ++_lastCookie;
  appendBarrier(bytes, cookie);
  if (!sendBytes(bytes)) return false;
  while (const auto answer = receive()) {
    if (answer->kind == FrameKind::barrierPassed && answer->cookie == cookie) return true;
  }
  return false;
}

bool RawClient::waitUntilClosed() {
  pollfd closed{_socket, POLLIN | POLLRDHUP, 0};
  const auto deadline = std::chrono::duration_cast<std::chrono::milliseconds>(kDeadline);
  if (::poll(&closed, 1, static_cast<int>(deadline.count())) != 1) return false;
  std::array<char, 64> rest{};
  const ssize_t count = ::recv(_socket, rest.data(), rest.size(), 0);
  return count == 0 || (count < 0 && errno == ECONNRESET);
}

}  // namespace zal::testing
