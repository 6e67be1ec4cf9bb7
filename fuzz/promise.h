#pragma once

#include <cstdio>
#include <cstdlib>

namespace zal {

/// Ends the process in any build, so that a fuzzer keeps the input that broke it.
inline void promise(bool kept, const char* what) {
  if (kept) return;
  std::fprintf(stderr, "broken: %s\n", what);
  std::abort();
}

}  // namespace zal
