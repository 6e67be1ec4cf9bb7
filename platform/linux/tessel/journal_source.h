#pragma once

#include <memory>

#include <systemd/sd-journal.h>

#include "platform/linux/tessel/log_source.h"
#include "platform/linux/tessel/record_line.h"

namespace zal::tessel {

/// The journal: all that this user may read of it.
class JournalSource final : public LogSource {
 public:
  /// The host's own, or the one in `directory`. None when there is no journal, and then `trouble` says
  /// so.
  [[nodiscard]] static std::unique_ptr<JournalSource> open(const std::optional<std::string>& directory,
                                                           const Clock& clock, std::string& trouble);
  [[nodiscard]] std::optional<std::string> print(std::optional<WallTime> since, LineOutput& output) override;
  [[nodiscard]] std::string follow(LineOutput& output) override;

 private:
  struct Close {
    void operator()(sd_journal* journal) const { sd_journal_close(journal); }
  };
  using Journal = std::unique_ptr<sd_journal, Close>;

  JournalSource(Journal journal, const Clock& clock) : _journal(std::move(journal)), _clock(clock) {}
  /// Up to the last entry there is.
  std::optional<std::string> _printRest(WallTime since, LineOutput& output);
  [[nodiscard]] Record _record(WallTime time) const;
  [[nodiscard]] std::string _field(const char* name) const;

  Journal _journal;
  const Clock& _clock;
};

}  // namespace zal::tessel
