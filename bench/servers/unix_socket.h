#pragma once

#include <filesystem>
#include <string_view>

namespace zal::bench {

/// A blocking Unix socket's client end. -1 inside when the connection was not had.
class UnixSocket {
 public:
  enum class Kind { stream, datagram };
  UnixSocket(Kind kind, const std::filesystem::path& path);
  ~UnixSocket();
  UnixSocket(const UnixSocket&) = delete;
  UnixSocket& operator=(const UnixSocket&) = delete;

  [[nodiscard]] bool connected() const { return _descriptor >= 0; }
  /// All of it, or the benchmark ends with a message: a peer that hangs up spoils every figure.
  void sendAll(std::string_view bytes) const;

 private:
  int _descriptor = -1;
};

}  // namespace zal::bench
