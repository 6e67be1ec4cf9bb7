#pragma once

#include <filesystem>
#include <string>

#include "bench/servers/log_server.h"
#include "bench/servers/unix_socket.h"

namespace zal::bench {

/// A log record as one frame of the agent's protocol.
[[nodiscard]] std::string recordFrame(unsigned client);

/// Writes one frame a record.
class FrameSender final : public RecordSender {
 public:
  FrameSender(const std::filesystem::path& socket, unsigned client);
  void send(std::uint64_t number) override;

 private:
  UnixSocket _socket;
  std::string _frame;
  std::size_t _position;
};

}  // namespace zal::bench
