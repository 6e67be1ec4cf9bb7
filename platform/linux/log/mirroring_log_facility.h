#pragma once

#include <string>

#include "platform/linux/log/journal_mirror.h"
#include "platform/log_facility.h"

namespace zal {

/// Files first, then the journal. Main thread only.
class MirroringLogFacility : public PlatformLogFacility {
 public:
  /// `files` is borrowed and made before this on the same loop: it writes before the journal is asked.
  MirroringLogFacility(PlatformLogFacility& files, JournalMirror::Host host, std::string journalSocket)
      : _files(files), _journal(host, std::move(journalSocket)) {}

  void record(const LogRecord& record) override {
    _files.record(record);
    _journal.record(record);
  }
  void flush() override {
    _files.flush();
    _journal.flush();
    // What was said about the journal is a record too.
    _files.flush();
  }

 private:
  PlatformLogFacility& _files;
  JournalMirror _journal;
};

}  // namespace zal
