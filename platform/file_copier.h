#pragma once

#include <functional>
#include <memory>
#include <string>

#include "platform/work_queue.h"

namespace zal {

/// What a copier job makes of its input.
enum class CopierOperation : int {
  compressIntoZip = 0,  ///< a zip archive of the tree, with the input directory as its top level
};

/// One job of the file copier. It must be kept alive until its completion has run.
class FileCopierJob {
 public:
  virtual ~FileCopierJob() = default;
  [[nodiscard]] virtual const std::string& identifier() const = 0;
  /// Returns at once. Call it once.
  virtual void start() = 0;
};

/// The host's file copier. Any thread.
///
/// An archive is whole or it is not there: before the job completes it is synced, read back and
/// checked. When it could not be written or does not hold what was read, nothing stands at the
/// output, and the input directory has been moved aside to a sibling named after it with
/// " (not archived)" appended, so that whoever deletes the input afterwards deletes nothing; one
/// warning says so. A missing input makes no archive and is no more than a line in the log. Fifos,
/// sockets and devices are left out, each with a line in the log; a file that grows is cut at the
/// size it had when it was opened.
class FileCopier {
 public:
  using Completion = std::function<void(FileCopierJob& job)>;
  virtual ~FileCopier() = default;
  /// The completion runs on the queue exactly once, success or not; the queue outlives the job.
  [[nodiscard]] virtual std::shared_ptr<FileCopierJob> makeJob(std::string input, std::string output,
                                                               std::string identifier,
                                                               CopierOperation operation, WorkQueue& queue,
                                                               Completion completion) = 0;
};

}  // namespace zal
