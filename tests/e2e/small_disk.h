#pragma once

#include <cerrno>
#include <string>

namespace zal::testing {

/// A file system of its own in memory, at a directory that it makes; unmounted at the end.
class SmallDisk {
 public:
  /// `size` as the kernel takes it ("1m"). Where nothing may be mounted, `error()` says why.
  SmallDisk(std::string directory, const std::string& size);
  ~SmallDisk();
  SmallDisk(const SmallDisk&) = delete;
  SmallDisk& operator=(const SmallDisk&) = delete;

  [[nodiscard]] int error() const { return _error; }
  /// So many bytes free from now on; what is there stays.
  void leaveFree(std::size_t bytes) const;
  /// Until not another block fits, or all but so many bytes.
  void fill(std::size_t bytesLeft = 0) const;
  void makeRoom() const;

 private:
  std::string _directory;
  int _error = 0;
};

}  // namespace zal::testing
