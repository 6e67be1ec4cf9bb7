#pragma once

#include <mutex>
#include <string>
#include <vector>

#include "platform/linux/files/descriptor.h"

namespace zal {

/// A private directory for files that are still being made, held with a lock as long as its process lives:
/// what lies in one that nobody holds was left by a process that is gone. Any thread.
class TemporaryArea {
 public:
  /// Nothing is made yet.
  explicit TemporaryArea(std::string base) : _base(std::move(base)) {}

  /// The area, made when it is not there: at the base, or beside it under a name of its own when another
  /// process holds that, left something in it, or somebody else has made it. When neither can be had, the
  /// path is given all the same and using it fails.
  [[nodiscard]] std::string path();

 private:
  [[nodiscard]] bool _hold(const std::string& path, bool onlyEmpty);

  const std::string _base;
  std::mutex _mutex;
  // Guarded by _mutex from here on.
  std::string _path;
  Descriptor _held;
};

/// The names of all areas, held or not, that such a base has in its parent directory.
[[nodiscard]] std::vector<std::string> temporaryAreaNames(const std::string& base);
/// Takes the lock of an area that nobody holds, and that is this user's own; not open otherwise.
[[nodiscard]] Descriptor holdDeserted(int parent, const std::string& name);

}  // namespace zal
