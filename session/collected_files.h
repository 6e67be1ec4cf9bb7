#pragma once

#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <string_view>

namespace zal {

class AgentLog;
class FileCollector;

/// Paths that clients asked to collect, by category.
using FilesByCategory = std::map<std::string, std::set<std::string>, std::less<>>;

/// The category as a relative path without "." and "..", empty for the directory itself. Nothing when
/// it would lead out of the directory or holds control characters.
[[nodiscard]] std::optional<std::string> containedCategory(std::string_view category);

/// "{path, path}"
[[nodiscard]] std::string fileSetText(const std::set<std::string>& files);

/// The text with its control characters shown as "?": for names that come from clients.
[[nodiscard]] std::string printable(std::string_view text);
[[nodiscard]] bool hasControlCharacters(std::string_view text);

/// Moves the files of each category into that subdirectory, one after the other. A category that would lead
/// out of the directory is refused with a warning, one that cannot be made is passed over; the others go on.
/// Any thread, one at a time; collector and log outlive it.
class CollectedFilesMove {
 public:
  CollectedFilesMove(FilesByCategory files, std::string directory, FileCollector& collector, AgentLog& log);
  /// Goes on up to the first file that would have to be copied, as it lies on another file system.
  /// Returned: whether there is none and all are moved.
  bool moveWithinFileSystem();
  /// Goes on with all that are left; waits for disks.
  void moveRest();

 private:
  /// Told of each file; false: not now.
  template <class Mover>
  bool _go(const Mover& isMoved);
  void _beginCategory();

  FilesByCategory _left;
  const std::string _directory;
  FileCollector& _collector;
  AgentLog& _log;
  bool _hasBegun = false;                   ///< with the first category that is left
  std::optional<std::string> _destination;  ///< of its files; none: they stay
};

}  // namespace zal
