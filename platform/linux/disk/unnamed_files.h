#pragma once

#include <sys/stat.h>

#include <string>
#include <vector>

namespace zal {

/// A file that lost its name, or never had one, and takes room as long as somebody has it open.
struct UnnamedFile {
  std::string path;  ///< as the kernel calls it, without its "(deleted)"
  struct stat status {};
};

/// Those in the directory that programs of this user have open, each once. The kernel names them by the
/// directory's path without links. What ends meanwhile is left out. Any thread; as quick as /proc is.
[[nodiscard]] std::vector<UnnamedFile> unnamedFilesIn(const std::string& directory);

}  // namespace zal
