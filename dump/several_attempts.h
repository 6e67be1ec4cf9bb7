#pragma once

#include <system_error>

namespace zal {

/// Up to three times, until there is no error: a disk that refuses for a moment, a signal, or a moment
/// without descriptors decides nothing. Returned: the last one's error.
template <class Step>
std::error_code inSeveralAttempts(const Step& step) {
  constexpr int kMostTimes = 3;
  std::error_code error;
  for (int time = 0; time < kMostTimes; ++time) {
    error = step();
    if (!error) break;
  }
  return error;
}

}  // namespace zal
