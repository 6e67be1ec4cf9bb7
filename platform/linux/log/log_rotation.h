#pragma once

#include <cstdint>
#include <string>
#include <system_error>
#include <vector>

namespace zal {

/// A log file whose rotation was begun and not ended.
struct UnfinishedRotation {
  std::string directory;  ///< the log set's
  std::string fileName;   ///< "<set>.log" or "<set>-Event.log"
  bool operator==(const UnfinishedRotation&) const = default;
};

struct UnfinishedRotations {
  std::vector<UnfinishedRotation> files;  ///< sorted, each once
  std::uint64_t highestSequence = 0;      ///< of all pending and ready files; 0: none
};

/// Looks through all log sets below the root. What cannot be read counts as empty.
[[nodiscard]] UnfinishedRotations findUnfinishedRotations(const std::string& userLogRoot);

/// Does what is left to do for one log file, oldest first: compresses pending files and moves them
/// into the generations. It goes on wherever an earlier run was cut off, so that at every moment each
/// record is in exactly one file that counts. Of more than nine waiting files the oldest are removed,
/// as nine newer ones would push them out. One run at a time for one file; any thread; takes its
/// time. A symbolic link in the place of the set's directory is not followed. Returned: why it stopped; a
/// later run goes on.
[[nodiscard]] std::error_code completeRotations(const UnfinishedRotation& rotation);

}  // namespace zal
