#pragma once

#include <string>

namespace zal {

/// What can be read of a file until it ends or a read fails, as it does in the process file system once the
/// process has ended; nothing where it cannot be opened. From the given offset on. For regular files and
/// those of /proc: it would wait for a pipe. Never throws but for memory. Any thread.
[[nodiscard]] std::string readableText(const std::string& path, long long from = 0);

}  // namespace zal
