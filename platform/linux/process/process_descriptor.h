#pragma once

#include <sys/types.h>

#include "platform/linux/files/descriptor.h"

namespace zal {

/// A descriptor that is readable once the process has ended; not open, with errno set, when there is no
/// such process or the kernel is older than 5.3. Close-on-exec.
[[nodiscard]] Descriptor processDescriptor(pid_t process);

}  // namespace zal
