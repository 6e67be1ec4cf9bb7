#pragma once

#include <sys/types.h>

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/wire/frame_decoder.h"

namespace zal {

/// A client's stream to the agent: connects, writes and reads without ever waiting or raising a
/// signal. One thread at a time. After a failure it is closed and trouble() says why.
class AgentSocket {
 public:
  enum class Attempt { connected, busy, refused };

  AgentSocket() = default;
  ~AgentSocket() { close(); }
  AgentSocket(const AgentSocket&) = delete;
  AgentSocket& operator=(const AgentSocket&) = delete;

  /// `busy`: an agent is there but has more newcomers than it can take just now.
  Attempt connect(const std::string& path);
  /// The agent sees the end of the stream even when a forked child still has the descriptor.
  void close();
  [[nodiscard]] bool isOpen() const { return _descriptor >= 0; }
  [[nodiscard]] int descriptor() const { return _descriptor; }
  [[nodiscard]] pid_t agent() const { return _agent; }
  [[nodiscard]] const std::string& trouble() const { return _trouble; }

  /// Bytes that the kernel took, 0 when it takes none now; nothing when the connection is broken,
  /// which leaves it open so that what the agent had answered can still be read.
  [[nodiscard]] std::optional<std::size_t> write(std::string_view bytes);
  /// Hands over each frame that has arrived. Returned: false when the stream has ended or makes no
  /// sense; it is closed then.
  bool read(const std::function<void(const Frame&)>& handle);

 private:
  bool _fail(std::string trouble);

  int _descriptor = -1;
  pid_t _agent = 0;
  FrameDecoder _decoder;
  std::string _trouble;
};

}  // namespace zal
