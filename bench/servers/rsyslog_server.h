#pragma once

#include "bench/servers/line_file.h"
#include "bench/servers/log_server.h"

namespace zal::bench {

/// rsyslogd with its socket input on a socket of ours, rate limit off, and its file output in its
/// traditional format; queues and threads as it comes.
class RsyslogServer final : public LogServer {
 public:
  [[nodiscard]] std::string_view name() const override { return "rsyslog"; }
  [[nodiscard]] std::string start(const std::filesystem::path& folder) override;
  [[nodiscard]] std::unique_ptr<RecordSender> connect(unsigned client) override;
  [[nodiscard]] std::uint64_t stored() override { return _file.lines(); }
  [[nodiscard]] std::uint64_t storedByReading() override { return _file.linesByReading(); }

 private:
  [[nodiscard]] bool _noticeFirstRecord() override { return _file.learnLineLength(); }
  std::filesystem::path _socket;
  LineFile _file;
};

}  // namespace zal::bench
