#pragma once

#include <string>

namespace zal {

/// 128 bits of the kernel's randomness as 32 hexadecimal digits. Throws std::system_error when the
/// kernel has none to give.
[[nodiscard]] std::string randomName();

/// Makes sure that the directory exists, is this user's own, no link, and closed to everyone else;
/// missing parents are made. Returned: whether it is so now.
[[nodiscard]] bool ensurePrivateDirectory(const std::string& path);

}  // namespace zal
