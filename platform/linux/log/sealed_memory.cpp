#include "platform/linux/log/sealed_memory.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>

namespace zal {
namespace {

bool writeWhole(int descriptor, std::string_view text) {
  while (!text.empty()) {
    const ssize_t count = ::write(descriptor, text.data(), text.size());
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return false;
    text.remove_prefix(static_cast<std::size_t>(count));
  }
  return true;
}

}  // namespace

Descriptor makeSealedMemory(std::initializer_list<std::string_view> parts) {
  Descriptor memory(::memfd_create("zalloggingagent-record", MFD_CLOEXEC | MFD_ALLOW_SEALING));
  if (!memory.isOpen()) return {};
  for (const std::string_view part : parts) {
    if (!writeWhole(memory.get(), part)) return {};
  }
  constexpr int kSeals = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_WRITE | F_SEAL_SEAL;
  if (::fcntl(memory.get(), F_ADD_SEALS, kSeals) != 0) return {};
  return memory;
}

}  // namespace zal
