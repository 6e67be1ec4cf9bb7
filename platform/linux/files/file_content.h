#pragma once

#include <system_error>

namespace zal {

/// Copies everything from the source's position to its end behind the target's position, inside the
/// kernel where the file systems can, else through memory. Waits for disks. Returned: why not.
[[nodiscard]] std::error_code copyFileContent(int source, int target);

}  // namespace zal
