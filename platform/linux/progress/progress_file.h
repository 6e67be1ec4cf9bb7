#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/linux/progress/progress_record.h"

namespace zal {

// The records of an agent's collections as other programs see them. Any process, any thread.

/// Where a runtime directory keeps them.
[[nodiscard]] std::string progressDirectory(const std::string& runtimeRoot);

/// The names of all records in the directory; they sort by time.
[[nodiscard]] std::vector<std::string> dumpProgressNames(const std::string& directory);

/// A record under its file's name.
struct ListedDumpProgress {
  std::string name;
  DumpProgressRecord record;
};

/// One of them as it is now; nothing when there is none. A record without an end, whose agent is gone,
/// is cut off.
[[nodiscard]] std::optional<DumpProgressRecord> readDumpProgress(const std::string& directory,
                                                                 const std::string& name);
/// All of them, the oldest first; files that are none are left out.
[[nodiscard]] std::vector<ListedDumpProgress> listDumpProgress(const std::string& directory);

}  // namespace zal
