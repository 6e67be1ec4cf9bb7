#pragma once

#include <string>
#include <string_view>

namespace zal {

/// The text as one word of a shell line: as it is when it consists of letters, digits and
/// "@ + . _ : -" (and "/", for paths), else in single quotes. A NUL ends it: no command line can
/// hold one.
[[nodiscard]] std::string shellWord(std::string_view text);
[[nodiscard]] std::string shellPath(std::string_view path);

}  // namespace zal
