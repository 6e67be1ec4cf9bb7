#pragma once

#include <span>
#include <string>
#include <string_view>

namespace zal {

class FilePlacement;

/// Deletes what earlier runs left of verbose logs: every visible entry of `logRoot`/<type> whose
/// full path contains "-Verbose-", one level deep. A directory that cannot be listed is passed over
/// and a failed deletion ignored, both without a word.
void purgeVerboseLogs(FilePlacement& files, const std::string& logRoot,
                      std::span<const std::string_view> types);

}  // namespace zal
