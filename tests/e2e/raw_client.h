#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/wire/frame_decoder.h"
#include "platform/linux/wire/message_builder.h"
#include "tests/e2e/agent_sandbox.h"

namespace zal::testing {

/// A peer that can send anything, byte for byte. Blocking; one thread, except that one may send
/// while another receives.
class RawClient {
 public:
  /// Throws when nobody listens.
  explicit RawClient(const std::string& socketPath);
  ~RawClient();
  RawClient(const RawClient&) = delete;
  RawClient& operator=(const RawClient&) = delete;

  [[nodiscard]] static bool canConnect(const std::string& socketPath);

  /// False when the agent closed the connection before all of it was sent.
  bool sendBytes(std::string_view bytes);
  /// One message that the function fills.
  bool send(const std::function<void(MessageBuilder&)>& fill);
  /// A log record of that type.
  bool sendLog(const std::string& type, const std::string& text);
  bool beginSession(const std::string& type, std::int64_t flags = 0);
  bool endSession(const std::string& type);
  bool sendCheckpoint(const std::string& type, const std::string& text, double time);
  bool sendDescription(const std::string& type, const std::string& log, double time);

  /// Appends a whole barrier frame.
  static void appendBarrier(std::string& bytes, std::uint64_t cookie);
  /// Waits for the next answer of any kind; nothing at the end of the stream or after the deadline.
  std::optional<FrameHeader> receive();
  /// All that was sent before is handled when this returns true.
  bool barrier();
  /// Whether the agent closes the connection before the deadline.
  bool waitUntilClosed();

 private:
  int _socket = -1;
  MessageBuilder _builder;
  std::string _buffer;
  FrameDecoder _decoder;
  std::string _received;
  std::uint64_t _lastCookie = 1'000'000'000;
};

}  // namespace zal::testing
