#pragma once

#include <sys/types.h>

#include <cstdint>
#include <string>

namespace zal {

/// Enough of a file's state to notice that somebody changed or replaced it.
struct FileSignature {
  int error = -1;             ///< why there is none (errno), 0 when there is one; -1: never looked
  std::int64_t modified = 0;  ///< nanoseconds since 1970
  std::int64_t changed = 0;   ///< the same for the inode: a write may set the other time back
  std::int64_t size = 0;
  ino_t inode = 0;

  [[nodiscard]] static FileSignature of(const std::string& path);
  bool operator==(const FileSignature&) const = default;
};

}  // namespace zal
