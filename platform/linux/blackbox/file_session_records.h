#pragma once

#include <memory>
#include <string>
#include <vector>

#include "platform/agent_log.h"
#include "platform/configuration.h"
#include "platform/linux/blackbox/record_file.h"
#include "platform/run_loop.h"
#include "platform/session_records.h"

namespace zal {

/// The black box as files in one directory (docs/reliability.md). Pieces gather in memory within a turn of
/// the loop and are written before it sleeps. Nothing is made before there is a session. Loop and log outlive
/// it. Main thread only.
class FileSessionRecords final : public SessionRecords {
 public:
  FileSessionRecords(RunLoop& loop, AgentLog& log, std::string directory, const BlackBoxSettings& settings);

  [[nodiscard]] std::shared_ptr<SessionRecord> begin() override;
  void flush() override;
  void recover(const std::function<bool(const UnfinishedRecord& record)>& handler) override;

 private:
  void _write();

  AgentLog& _log;
  const std::string _directory;
  const BlackBoxSettings _settings;
  std::vector<std::weak_ptr<RecordFile>> _open;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // last: the loop's observer looks for it
};

}  // namespace zal
