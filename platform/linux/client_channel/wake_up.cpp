#include "platform/linux/client_channel/wake_up.h"

#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <system_error>

namespace zal {

WakeUp::WakeUp() : _descriptor(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
  if (_descriptor < 0) throw std::system_error(errno, std::generic_category(), "eventfd");
}

WakeUp::~WakeUp() { ::close(_descriptor); }

void WakeUp::wake() {
  const std::uint64_t one = 1;
  // Fails only when so many wake-ups are pending that one more changes nothing.
  [[maybe_unused]] const auto written = ::write(_descriptor, &one, sizeof one);
}

void WakeUp::drain() {
  std::uint64_t count = 0;
  [[maybe_unused]] const auto read = ::read(_descriptor, &count, sizeof count);
}

}  // namespace zal
