#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "platform/work_queue.h"

namespace zal {

/// What a copier job makes of its input.
enum class CopierOperation : int {
  compressIntoZip = 0,  ///< a zip archive of the tree, with the input directory as its top level
};

/// An entry of an archive that is no directory, as it came to lie there.
struct ArchivedFile {
  std::string name;  ///< below the top level, in UTF-8
  std::uint64_t bytes = 0;
  std::string sha256;  ///< 64 hexadecimal digits; of a symbolic link's target, where it is one
  bool isCut = false;  ///< it became shorter, or unreadable, while it was read
};

struct ArchiveContent {
  std::vector<ArchivedFile> files;   ///< in the archive's order
  std::vector<std::string> remarks;  ///< what was left out or cut, one line each
};

/// A text that an archive says about itself: its last entry, below the top level. When that name is
/// taken there, the entry's gets "-2" appended, "-3" …
struct ArchiveEnding {
  std::string name;
  std::function<std::string(const ArchiveContent&)> text;  ///< empty: there is none
};

/// One job of the file copier. It must be kept alive until its completion has run.
class FileCopierJob {
 public:
  virtual ~FileCopierJob() = default;
  [[nodiscard]] virtual const std::string& identifier() const = 0;
  /// Before start. The text is asked for once, on the job's own thread, when all else is written.
  virtual void endWith(ArchiveEnding ending) = 0;
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
