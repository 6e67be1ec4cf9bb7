#pragma once

#include <sys/stat.h>

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/linux/archive/archive_output.h"
#include "platform/linux/archive/zip_container.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/rooted_paths.h"

namespace zal {

/// Something found on the walk. Its status is that of the opened file, where there is one.
struct FoundEntry {
  ArchiveEntry entry;
  std::string path;  ///< for messages
  Descriptor file;   ///< open for reading, when it is a regular file
  std::string link;  ///< where it leads, when it is a symbolic link
};

/// Everything in a directory, itself first, directories before their content, names in the order of
/// their bytes. Reads one directory at a time. Symbolic links are found, never followed. What is no
/// file, directory or link, and what cannot be read, is left out with a line; so is told what goes by another
/// name in an archive.
class TreeWalk {
 public:
  using Line = std::function<void(const std::string&)>;
  /// Throws std::system_error when the directory cannot be read, is none, or is a link.
  TreeWalk(const RootedPaths& paths, const std::string& directory, Line leftOut, Line renamed);
  /// The next one, nothing at the end. Throws std::system_error when this process, not the file, is at
  /// fault: without descriptors or memory nothing can be said about what is there.
  [[nodiscard]] std::optional<FoundEntry> next();
  /// Whether something was left out though it was there to be read: the disk, or what lies between, failed.
  [[nodiscard]] bool hasMissed() const { return _hasMissed; }

 private:
  struct Directory {
    Descriptor opened;
    std::string path, entryPath;  // both end with a slash
    std::vector<std::string> names;
    std::vector<std::string> entries;  // empty when they are the names
    std::size_t at = 0;
  };
  [[nodiscard]] std::optional<FoundEntry> _look(const Directory& directory, std::size_t index);
  [[nodiscard]] FoundEntry _enter(Descriptor opened, const std::string& path, const std::string& entryPath);
  [[nodiscard]] std::vector<std::string> _list(int directory, const std::string& path);
  void _leaveOut(const std::string& path, const std::string& reason) const;
  void _leaveOutForError(const std::string& path);

  const Line _leftOut, _renamed;
  std::vector<Directory> _open;  // from the outermost to the one being read
  std::optional<FoundEntry> _first;
  bool _hasMissed = false;
};

}  // namespace zal
