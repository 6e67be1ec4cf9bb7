#include "platform/linux/files/readable_text.h"

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <cerrno>

#include "platform/linux/files/descriptor.h"

namespace zal {

std::string readableText(const std::string& path, long long from) {
  const Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY));
  std::string text;
  if (!file.isOpen() || (from > 0 && ::lseek(file.get(), from, SEEK_SET) < 0)) return text;
  std::array<char, 16384> piece;
  while (true) {
    const ssize_t count = ::read(file.get(), piece.data(), piece.size());
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return text;
    text.append(piece.data(), static_cast<std::size_t>(count));
  }
}

}  // namespace zal
