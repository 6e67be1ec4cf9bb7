#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <string>
#include <string_view>

#include "bench/support/child_process.h"

namespace zal::bench {

/// One client's way to a server. One thread each.
class RecordSender {
 public:
  virtual ~RecordSender() = default;
  /// Hands over one record with one system call; waits while the server is behind.
  virtual void send(std::uint64_t number) = 0;
  /// Hands over what is still held back.
  virtual void finish() {}
};

/// A logging daemon under measurement, started in a folder of its own with nothing else to do.
class LogServer {
 public:
  virtual ~LogServer() = default;
  [[nodiscard]] virtual std::string_view name() const = 0;
  /// Starts the daemon and waits until it listens. Returned: why not, or nothing.
  [[nodiscard]] virtual std::string start(const std::filesystem::path& folder) = 0;
  /// A new client. `client` goes into its records.
  [[nodiscard]] virtual std::unique_ptr<RecordSender> connect(unsigned client) = 0;
  /// Sends one record and waits for it, so that what is made on first use is made. Returned: whether it came.
  [[nodiscard]] bool warmUp();
  /// Records in the daemon's file by now, from warmUp() on. Cheap: asked in a tight loop.
  [[nodiscard]] virtual std::uint64_t stored() = 0;
  /// The same, counted by reading the files; for checking afterwards.
  [[nodiscard]] virtual std::uint64_t storedByReading() = 0;
  [[nodiscard]] pid_t processId() const { return _process.id(); }
  [[nodiscard]] bool running() { return _process.running(); }
  void stop() { _process.stop(); }

 protected:
  /// Whether the first record is there; called again and again until it is.
  [[nodiscard]] virtual bool _noticeFirstRecord() = 0;
  ChildProcess _process;
};

}  // namespace zal::bench
