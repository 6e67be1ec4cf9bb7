#pragma once

#include <filesystem>
#include <string>

namespace zal::bench {

/// A folder for one run of one daemon, gone with everything in it afterwards. In memory where the host
/// has room there, so that every daemon, not only the one with volatile storage, is spared the disk.
class ScratchFolder {
 public:
  ScratchFolder();
  ~ScratchFolder();
  ScratchFolder(const ScratchFolder&) = delete;
  ScratchFolder& operator=(const ScratchFolder&) = delete;
  [[nodiscard]] const std::filesystem::path& path() const { return _path; }
  [[nodiscard]] static std::filesystem::path parent();

 private:
  std::filesystem::path _path;
};

}  // namespace zal::bench
