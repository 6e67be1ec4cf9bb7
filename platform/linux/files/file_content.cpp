#include "platform/linux/files/file_content.h"

#include <unistd.h>

#include <cerrno>
#include <vector>

#include "platform/linux/files/system_error.h"

namespace zal {

namespace {

constexpr std::size_t kKernelPortion = std::size_t{1} << 30U;
constexpr std::size_t kMemoryPortion = std::size_t{128} << 10U;

std::error_code writeWhole(int target, const char* bytes, std::size_t count) {
  while (count > 0) {
    const ssize_t written = ::write(target, bytes, count);
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) return lastSystemError();
    bytes += written;
    count -= static_cast<std::size_t>(written);
  }
  return {};
}

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
    if (const auto error = writeWhole(target, buffer.data(), static_cast<std::size_t>(got))) return error;
  }
}

}  // namespace zal
