#include "platform/linux/process/process_descriptor.h"

#include <sys/syscall.h>
#include <unistd.h>

namespace zal {

// The C library's own declaration is missing its C linkage in Debian 12.
Descriptor processDescriptor(pid_t process) {
  return Descriptor(static_cast<int>(::syscall(SYS_pidfd_open, process, 0)));
}

}  // namespace zal
