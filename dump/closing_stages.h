#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "dump/collection_flags.h"
#include "dump/collection_record.h"
#include "platform/clock.h"

namespace zal {

class Collectors;
class DiskBudgetKeeper;
class _LirraLogCompressor;
struct Platform;

/// Slow writers get this long between the two closing stages.
inline constexpr std::chrono::seconds kSecondStageDelay{8};
/// How often a baseband dump that is still being written is looked at.
inline constexpr std::chrono::seconds kBasebandPollInterval{1};
inline constexpr std::uint32_t kStackshotCode = 0xF33D1337;

/// What the closing stages of one collection work on.
struct ClosingWork {
  std::string service;
  std::string destination;  ///< becomes the archive
  std::string pushLogs, networkStack, systemLogs, basebandLogs, snapshots, packetCaptures, power;
  std::optional<std::string> reason;
  CollectionFlags flags = 0;
  bool savesRoom = false;                ///< the big steps are skipped
  std::shared_ptr<void> held = nullptr;  ///< keeps destination and archive from being evicted
  WallTime startTime{};
  std::shared_ptr<CollectionRecord> record;  ///< never empty
  std::size_t firstStep = 1;                 ///< of these stages among the wanted ones
  std::function<void()> completion;          ///< may be empty
};

/// The end of every collection: logs that other daemons write in answer to it, the waits for them,
/// the archive and the link to it. Any thread; the services are borrowed and outlive every job.
class ClosingStages {
 public:
  struct Services {
    Platform& platform;
    Collectors& collectors;
    _LirraLogCompressor& compressor;
    DiskBudgetKeeper* disk = nullptr;  ///< looks when an archive was made
  };
  explicit ClosingStages(const Services& services) : _services(services) {}

  /// The first stage, on the calling thread; the second follows by timer on the standard queue. The
  /// completion runs once, on the main thread, archive or not; never while a baseband dump goes on.
  void run(ClosingWork work);
  /// Archives and links what former agents gathered and did not live to archive: as far as they got. For
  /// the start; the work itself goes on on the standard queue. Nobody is told, and the manifest says so.
  void finishCutOff();
  /// Their steps with these flags, those that are skipped too.
  [[nodiscard]] static std::vector<PlannedStep> plan(CollectionFlags flags, bool savesRoom = false);

 private:
  Services _services;
};

}  // namespace zal
