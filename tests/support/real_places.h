#pragma once

#include <string>

namespace zal::testing {

/// A fresh directory on another file system than the temporary one (shared memory), removed at the
/// end. `path` is empty when this machine has none; why is in `missing`.
class OtherFileSystem {
 public:
  OtherFileSystem();
  ~OtherFileSystem();
  OtherFileSystem(const OtherFileSystem&) = delete;
  OtherFileSystem& operator=(const OtherFileSystem&) = delete;
  [[nodiscard]] std::string operator/(const std::string& name) const { return path + "/" + name; }

  std::string path;
  std::string missing;
};

/// A file system of 64 KiB mounted at the directory for as long as this lives. `missing` says why it
/// could not be (not the superuser, mounts forbidden).
class TinyFileSystem {
 public:
  explicit TinyFileSystem(std::string directory);
  ~TinyFileSystem();
  TinyFileSystem(const TinyFileSystem&) = delete;
  TinyFileSystem& operator=(const TinyFileSystem&) = delete;

  std::string missing;

 private:
  const std::string _directory;
};

/// Permission bits in octal and the modification time in nanoseconds: "640 1500000000123456789".
std::string modeAndTime(const std::string& path);
/// Sets the modification time, of a link itself too.
void setTime(const std::string& path, long seconds, long nanoseconds);
/// Makes a pipe with a name; opening it for reading would hang.
void makeNamedPipe(const std::string& path);

}  // namespace zal::testing
