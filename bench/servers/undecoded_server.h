#pragma once

#include "bench/servers/line_file.h"
#include "bench/servers/log_server.h"

namespace zal::bench {

/// The limit: the agent's own frames, moved from sockets into one file without a look at them.
class UndecodedServer final : public LogServer {
 public:
  explicit UndecodedServer(std::filesystem::path programFolder) : _programFolder(std::move(programFolder)) {}
  [[nodiscard]] std::string_view name() const override { return "undecoded"; }
  [[nodiscard]] std::string start(const std::filesystem::path& folder) override;
  [[nodiscard]] std::unique_ptr<RecordSender> connect(unsigned client) override;
  [[nodiscard]] std::uint64_t stored() override { return _file.lines(); }
  [[nodiscard]] std::uint64_t storedByReading() override { return _file.lines(); }

 private:
  [[nodiscard]] bool _noticeFirstRecord() override { return _file.learnLineLength(); }
  std::filesystem::path _programFolder;
  std::filesystem::path _socket;
  LineFile _file;
};

}  // namespace zal::bench
