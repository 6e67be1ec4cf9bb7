#pragma once

#include <string>
#include <vector>

namespace zal {

/// What the names of one directory are called in an archive, in the same order: in UTF-8, and each
/// different from the others. Bytes that are no UTF-8 become U+FFFD; where that makes two names one, the
/// later gets "-2" appended, "-3" …
[[nodiscard]] std::vector<std::string> entryNames(const std::vector<std::string>& names);

}  // namespace zal
