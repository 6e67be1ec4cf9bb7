#pragma once

#include <functional>
#include <memory>

#include "platform/dump_progress.h"
#include "platform/linux/bus_module/bus_door.h"

namespace zal {

/// Progress records whose news are told to somebody else, too. Any thread.
class AnnouncedDumpProgress : public DumpProgressRecords {
 public:
  /// Of what a collection misses; one more says that there are others.
  static constexpr std::size_t kMostMissing = 100;
  using Announce = std::function<void(DumpNews news)>;

  /// `announce` is called on the collection's thread and must not wait. It and the records outlive
  /// every record.
  AnnouncedDumpProgress(DumpProgressRecords& records, Announce announce);

  [[nodiscard]] std::shared_ptr<DumpProgress> begin(DumpPlan plan) override;
  [[nodiscard]] std::vector<CutOffDump> cutOff() override { return _records.cutOff(); }

 private:
  DumpProgressRecords& _records;
  const Announce _announce;
};

}  // namespace zal
