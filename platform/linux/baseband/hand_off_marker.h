#pragma once

#include <string>
#include <system_error>
#include <variant>

#include "platform/linux/files/descriptor.h"

namespace zal {

/// The file that stands for "a baseband dump is being written": who collects the dump waits until it is
/// gone. Whoever starts a dump places it; the process that writes the dump takes it, which is a lock on
/// it that ends with the process, and removes it with its own end. So a marker that nobody holds is one
/// of a writer that was killed, or of one that has yet to begin. Any thread.
class HandOffMarker {
 public:
  /// Makes the file unless it is there. Returned: why it is not there.
  [[nodiscard]] static std::error_code place(const std::string& path);
  /// Takes it, makes it first if need be. Returned: why not; device_or_resource_busy when another
  /// process holds it.
  [[nodiscard]] static std::variant<HandOffMarker, std::error_code> take(const std::string& path);
  /// Removes the file when there is one that nobody holds.
  static void removeUnlessHeld(const std::string& path);

  /// Removes the file, then gives up the lock.
  ~HandOffMarker();
  HandOffMarker(HandOffMarker&&) = default;
  HandOffMarker& operator=(HandOffMarker&&) = delete;

 private:
  HandOffMarker(std::string path, Descriptor locked) : _path(std::move(path)), _locked(std::move(locked)) {}

  std::string _path;
  Descriptor _locked;
};

}  // namespace zal
