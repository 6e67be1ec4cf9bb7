#pragma once

#include <memory>
#include <mutex>
#include <string>

#include "platform/agent_log.h"
#include "platform/clock.h"
#include "platform/dump_progress.h"
#include "platform/linux/process/process_identity.h"

namespace zal {

/// Progress records as files in the runtime directory, one for each collection, each line written at
/// once: see progress_file.h and docs/runtime-directory.md. The newest 20 are kept, and those that
/// still run. Where a record cannot be written, one warning is logged and the collection goes on
/// without. Any thread.
class RuntimeDumpProgress : public DumpProgressRecords {
 public:
  /// Clock and log outlive this and every record. Nothing is made before the first collection.
  RuntimeDumpProgress(const Clock& clock, AgentLog& log, std::string directory);

  [[nodiscard]] std::shared_ptr<DumpProgress> begin(DumpPlan plan) override;
  [[nodiscard]] std::vector<CutOffDump> cutOff() override;

 private:
  std::string _nextPath(WallTime now, const ProcessIdentity& agent);
  void _prune() const;

  const Clock& _clock;
  AgentLog& _log;
  const std::string _directory;
  std::mutex _mutex;      // one that begins does not prune what another just made
  unsigned _counter = 0;  // guarded by _mutex
};

}  // namespace zal
