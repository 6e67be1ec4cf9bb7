#pragma once

#include <sys/types.h>

#include <cstdint>
#include <ostream>
#include <string>

namespace zal::testing {

/// What a process holds of its host at one moment.
struct ProcessSize {
  std::uint64_t residentKilobytes = 0;
  std::uint64_t descriptors = 0;
  std::uint64_t threads = 0;

  [[nodiscard]] static ProcessSize of(pid_t process);
};

std::ostream& operator<<(std::ostream& out, const ProcessSize& size);

/// Regular files below a directory, at any depth; 0 when there is none.
[[nodiscard]] std::uint64_t filesBelow(const std::string& directory);

/// How long a soak is: what that variable of the environment says, else a length for everyday tests.
[[nodiscard]] int soakLength(const char* variable, int everyday);

}  // namespace zal::testing
