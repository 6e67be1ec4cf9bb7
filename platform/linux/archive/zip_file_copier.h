#pragma once

#include <memory>
#include <string>

#include "platform/agent_log.h"
#include "platform/configuration.h"
#include "platform/file_copier.h"
#include "platform/work_queue.h"

namespace zal {

/// Makes zip archives. Any thread. A job runs on the standard global queue, in two steps: writing,
/// then reading back. It keeps itself until its completion has run, so one that its owner dropped ends
/// like any other. A file that cannot be read is left out with a line; that is no failure of the archive.
/// An input that is no directory cannot be archived. The queues and the log outlive the jobs.
class ZipFileCopier : public FileCopier {
 public:
  ZipFileCopier(WorkQueues& queues, AgentLog& log, ArchiveCompression compression)
      : _queues(queues), _log(log), _compression(compression) {}

  [[nodiscard]] std::shared_ptr<FileCopierJob> makeJob(std::string input, std::string output,
                                                       std::string identifier, CopierOperation operation,
                                                       WorkQueue& queue, Completion completion) override;

 private:
  WorkQueues& _queues;
  AgentLog& _log;
  const ArchiveCompression _compression;
};

}  // namespace zal
