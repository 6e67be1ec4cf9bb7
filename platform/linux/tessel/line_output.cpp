#include "platform/linux/tessel/line_output.h"

#include <unistd.h>

#include <cerrno>
#include <system_error>

namespace zal::tessel {

bool LineOutput::write(std::string_view lines) {
  while (!lines.empty()) {
    const ssize_t written = ::write(_descriptor, lines.data(), lines.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) {
      _trouble = "the output cannot be written: " + std::generic_category().message(errno);
      return false;
    }
    lines.remove_prefix(static_cast<std::size_t>(written));
  }
  return true;
}

}  // namespace zal::tessel
