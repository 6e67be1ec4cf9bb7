#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace zal::testing {

/// A system call that is to fail.
struct FailingCall {
  int number = 0;  ///< SYS_…
  int error = 0;
  int times = 1;                                              ///< the first so many; then they succeed
  std::function<bool(const std::uint64_t* words)> ofThose{};  ///< by the arguments; empty: all
};

/// Of those whose second argument is that path or ends with it.
[[nodiscard]] std::function<bool(const std::uint64_t* words)> namesPath(std::string end);

/// Does the work on a thread of its own, in which the calls fail, and in all that it starts: these have to
/// end within it. The kernel asks the caller before each of them. False, and nothing done, where the host
/// lets nobody be asked.
[[nodiscard]] bool withFailingCalls(std::vector<FailingCall> calls, const std::function<void()>& work);

}  // namespace zal::testing
