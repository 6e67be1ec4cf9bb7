#pragma once

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstring>
#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "platform/linux/wire/frame_decoder.h"
#include "platform/linux/wire/message_builder.h"

namespace zal {

/// A request with the code and a text under "text".
inline std::string requestFrame(std::int64_t code, const std::string& text = "",
                                FrameKind kind = FrameKind::message, std::uint64_t cookie = 0) {
  MessageBuilder builder;
  builder.setInt64("code", code);
  builder.setString("text", text);
  std::string bytes;
  builder.finish(bytes, kind, cookie);
  return bytes;
}

inline std::string bareFrame(FrameKind kind, std::uint64_t cookie, std::string_view payload = {}) {
  std::string bytes;
  FrameHeader header;
  header.kind = kind;
  header.cookie = cookie;
  appendFrame(bytes, header, payload);
  return bytes;
}

/// A client made of system calls, so that it can do everything wrong that a client can.
class TestClient {
 public:
  explicit TestClient(const std::string& path) : _socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.copy(address.sun_path, sizeof address.sun_path - 1);
    _connected = ::connect(_socket, reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0;
  }
  ~TestClient() { close(); }
  TestClient(const TestClient&) = delete;
  TestClient& operator=(const TestClient&) = delete;

  [[nodiscard]] bool isConnected() const { return _connected; }
  [[nodiscard]] int socket() const { return _socket; }
  void close() {
    if (_socket >= 0) ::close(std::exchange(_socket, -1));
  }
  void endWriting() const { ::shutdown(_socket, SHUT_WR); }

  /// Waits until the kernel has it all; false when the other side is gone.
  [[nodiscard]] bool send(std::string_view bytes) const {
    while (!bytes.empty()) {
      const auto sent = ::send(_socket, bytes.data(), bytes.size(), MSG_NOSIGNAL);
      if (sent <= 0) return false;
      bytes.remove_prefix(static_cast<std::size_t>(sent));
    }
    return true;
  }

  /// Reads what is there without waiting. Frames so far, as "kind/cookie/payload size".
  const std::vector<std::string>& frames() {
    char buffer[65536];
    ssize_t size = 0;
    while ((size = ::recv(_socket, buffer, sizeof buffer, MSG_DONTWAIT)) > 0) {
      _decoder.feed({buffer, static_cast<std::size_t>(size)});
      while (const auto frame = _decoder.next()) {
        _frames.push_back(std::to_string(static_cast<int>(frame->header.kind)) + "/" +
                          std::to_string(frame->header.cookie) + "/" + std::to_string(frame->payload.size()));
        _payloads.emplace_back(frame->payload);
      }
    }
    _ended = size == 0 || (errno != EAGAIN && errno != EWOULDBLOCK);
    return _frames;
  }
  /// Of the frames so far.
  [[nodiscard]] const std::vector<std::string>& payloads() const { return _payloads; }
  /// Whether the other side has closed, as far as read.
  [[nodiscard]] bool seesTheEnd() {
    frames();
    return _ended;
  }

 private:
  int _socket;
  bool _connected = false;
  bool _ended = false;
  FrameDecoder _decoder;
  std::vector<std::string> _frames;
  std::vector<std::string> _payloads;
};

}  // namespace zal
