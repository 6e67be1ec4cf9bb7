#pragma once

#include "bench/servers/journal_count.h"
#include "bench/servers/log_server.h"

namespace zal::bench {

/// systemd-journald with volatile storage, alone in a host of its own, no rate limit, no forwarding.
/// Its clients speak its native protocol, one record a datagram, as its own library does.
class JournaldServer final : public LogServer {
 public:
  [[nodiscard]] std::string_view name() const override { return "journald"; }
  [[nodiscard]] std::string start(const std::filesystem::path& folder) override;
  [[nodiscard]] std::unique_ptr<RecordSender> connect(unsigned client) override;
  [[nodiscard]] std::uint64_t stored() override;
  [[nodiscard]] std::uint64_t storedByReading() override;
  /// Where it listens once it is started.
  [[nodiscard]] std::filesystem::path socket() const { return _run / "systemd/journal/socket"; }

  /// Where it keeps its files.
  [[nodiscard]] std::filesystem::path directory() const { return _run / "log/journal"; }

 private:
  [[nodiscard]] bool _noticeFirstRecord() override { return stored() > 0; }
  std::filesystem::path _run;  ///< the daemon's own /run, seen from here
  JournalCount _count;
  std::uint64_t _ownEntries = 0;  ///< what the daemon says about itself at its start
};

}  // namespace zal::bench
