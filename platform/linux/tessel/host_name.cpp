#include "platform/linux/tessel/host_name.h"

#include <unistd.h>

#include <array>

namespace zal::tessel {

std::string hostName() {
  std::array<char, 256> buffer{};
  if (::gethostname(buffer.data(), buffer.size() - 1) != 0) return "-";
  const std::string name = buffer.data();
  return name.empty() ? "-" : name.substr(0, name.find('.'));
}

}  // namespace zal::tessel
