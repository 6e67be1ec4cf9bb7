#pragma once

#include <memory>
#include <string>
#include <utility>

#include "platform/agent_log.h"
#include "platform/configuration.h"
#include "platform/file_copier.h"
#include "platform/linux/files/rooted_paths.h"
#include "platform/work_queue.h"

namespace zal {

/// Makes zip archives. Any thread. A job runs on the standard global queue, in two steps: writing,
/// then reading back. It keeps itself until its completion has run, so one that its owner dropped ends
/// like any other. A file that cannot be read is left out with a line; that is no failure of the archive.
/// An input that is no directory, or is reached through a symbolic link below a root, cannot be archived. The
/// queues and the log outlive the jobs.
class ZipFileCopier : public FileCopier {
 public:
  ZipFileCopier(WorkQueues& queues, AgentLog& log, ArchiveCompression compression, RootedPaths paths = {})
      : _queues(queues), _log(log), _compression(compression), _paths(std::move(paths)) {}

  [[nodiscard]] std::shared_ptr<FileCopierJob> makeJob(std::string input, std::string output,
                                                       std::string identifier, CopierOperation operation,
                                                       WorkQueue& queue, Completion completion) override;

 private:
  WorkQueues& _queues;
  AgentLog& _log;
  const ArchiveCompression _compression;
  const RootedPaths _paths;
};

}  // namespace zal
