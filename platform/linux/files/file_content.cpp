#include "platform/linux/files/file_content.h"

#include <unistd.h>

#include <cerrno>
#include <vector>

#include "platform/linux/files/system_error.h"
#include "platform/linux/files/whole_file.h"

namespace zal {

namespace {

constexpr std::size_t kKernelPortion = std::size_t{1} << 30U;
constexpr std::size_t kMemoryPortion = std::size_t{128} << 10U;

}  // namespace

std::error_code copyFileContent(int source, int target) {
  while (::copy_file_range(source, nullptr, target, nullptr, kKernelPortion, 0) > 0) {
  }
  // The plain loop has the last word: it carries on where the kernel's copy does not work (other
  // file systems, generated files that claim to be empty) and reports what really fails.
  std::vector<char> buffer(kMemoryPortion);
  for (;;) {
    const ssize_t got = ::read(source, buffer.data(), buffer.size());
    if (got < 0 && errno == EINTR) continue;
    if (got < 0) return lastSystemError();
    if (got == 0) return {};
    if (const auto error = writeWhole(target, {buffer.data(), static_cast<std::size_t>(got)})) return error;
  }
}

}  // namespace zal
