#pragma once

#include <string>

#include "platform/linux/files/descriptor.h"

namespace zal::tessel {

/// Waits for a change of a file, or of what a path names. Where the kernel has no watch to give it
/// wakes once a second instead.
class FileWatch {
 public:
  explicit FileWatch(const std::string& path);
  /// Watches the file that the path names now as well; those watched before stay so.
  void addFile();
  void wait();

 private:
  std::string _path;
  Descriptor _inotify;
  bool _watches = false;  ///< the directory is watched, so no new file is missed
};

}  // namespace zal::tessel
