#pragma once

#include <cstdio>
#include <string>

namespace zal {

/// Opens a new file for writing, for names that others know beforehand in directories that they write to.
/// The file or link that had the name loses it; what a link leads to stays as it is. A device is opened as
/// it is. Any thread. nullptr: errno says why.
[[nodiscard]] std::FILE* openFreshFile(const std::string& path);

}  // namespace zal
