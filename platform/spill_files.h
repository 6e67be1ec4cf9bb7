#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

namespace zal {

/// Room on the disk for what is too much for memory. Nobody else sees it, and it is gone with the object or
/// with the process. Any thread, one at a time.
class SpillFile {
 public:
  virtual ~SpillFile() = default;
  /// Adds all of it at the end. False: nothing of it counts, and trouble() says why.
  virtual bool append(std::string_view bytes) = 0;
  /// What has been added so far.
  [[nodiscard]] virtual std::uint64_t size() const = 0;
  /// Fills the buffer from there. False: the medium did not give all of it.
  virtual bool read(std::uint64_t offset, char* buffer, std::size_t size) = 0;
  [[nodiscard]] virtual std::string trouble() const = 0;
};

/// Any thread.
class SpillFiles {
 public:
  virtual ~SpillFiles() = default;
  /// An empty one; it takes no room before something is added, and a disk that refuses it says so then.
  [[nodiscard]] virtual std::unique_ptr<SpillFile> make() = 0;
};

}  // namespace zal
