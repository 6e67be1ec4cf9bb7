#pragma once

#include <sys/stat.h>

#include <chrono>

#include "platform/clock.h"

namespace zal {

/// When the file, or the directory itself, last changed.
[[nodiscard]] inline WallTime changedAt(const struct stat& status) {
  return WallTime{std::chrono::seconds{status.st_mtim.tv_sec} +
                  std::chrono::microseconds{status.st_mtim.tv_nsec / 1000}};
}

}  // namespace zal
