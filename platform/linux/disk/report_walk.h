#pragma once

#include <sys/stat.h>

#include <set>
#include <string>
#include <utility>
#include <vector>

#include "platform/kept_item.h"

namespace zal {

/// A file or directory, whatever it is called.
using FileId = std::pair<dev_t, ino_t>;

/// What of the reports must stay.
struct ReportsInUse {
  std::set<FileId> collected;  ///< directories and archives of collections that go on
  std::set<FileId> linked;     ///< archives that a `Latest-` link leads to
};

/// Every session, dump and stub of this user below the open directory, at least one level and at most four
/// deep. The path is for the items' names.
[[nodiscard]] std::vector<KeptItem> walkReports(int directory, const std::string& path,
                                                const ReportsInUse& inUse);

}  // namespace zal
