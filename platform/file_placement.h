#pragma once

#include <cstdio>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>

namespace zal {

/// What placing files needs from the host. Any thread; may wait for a disk. Paths are plain UTF-8. What is
/// made, replaced or removed below one of the configured roots is reached from there through directories
/// alone: a symbolic link on the way is an error, and nothing happens behind it.
class FilePlacement {
 public:
  virtual ~FilePlacement() = default;
  /// The home directory that a leading "~" stands for.
  [[nodiscard]] virtual std::string homeDirectory() const = 0;
  /// A path in the temporary area that names nothing yet and that nobody can guess.
  [[nodiscard]] virtual std::string randomTemporaryPath(std::string_view suffix) = 0;
  /// The path itself when nothing exists there, else the first free "name-2.ext", "name-3.ext" …;
  /// nothing when they are all taken or cannot be names. Where a look fails otherwise, the path that
  /// was looked at, which may be taken.
  [[nodiscard]] virtual std::optional<std::string> uniqueSavePath(const std::string& path) = 0;
  /// Hard link; an existing target is an error, never overwritten. Symbolic links are not followed.
  /// Where the target lies on another file system, and only there, a file gets a copy with its mode
  /// and times instead, which no longer grows with its writer; anything else is an error.
  virtual std::error_code link(const std::string& source, const std::string& target) = 0;
  /// Quick. An existing target is an error, and so is one on another file system: cross_device_link.
  virtual std::error_code rename(const std::string& source, const std::string& target) = 0;
  /// Rename; across file systems a synced copy and then the removal, so that at every moment at
  /// least one whole file exists. An existing target is an error.
  virtual std::error_code move(const std::string& source, const std::string& target) = 0;
  /// Before a program writes a file whose name others know: makes sure that the name leads to a file of
  /// this user's own or to nothing. What somebody else put there goes, a link without what it leads to.
  /// An error when it cannot be made sure; that the directory is missing is none.
  virtual std::error_code prepareOutput(const std::string& path) = 0;
  /// Copies a file, or a directory with all below it, with modes and modification times; symbolic
  /// links as links. An existing target is an error.
  virtual std::error_code copy(const std::string& source, const std::string& target) = 0;
  /// Makes the directory with all missing parents. Each one that was made gets mode 0777 whatever the
  /// umask says, for several users' daemons write there; one that existed keeps its mode. Returned: no
  /// error when the directory is there at the end.
  virtual std::error_code makeDirectories(const std::string& path) = 0;
  /// Opens a new file for writing, for names that others know beforehand in directories that they write
  /// to. The file or link that had the name loses it; what a link leads to stays as it is. A device is
  /// opened as it is. The caller closes it. nullptr: errno says why.
  [[nodiscard]] virtual std::FILE* openFresh(const std::string& path) = 0;
  /// Rename onto whatever file or link has the name; both on one file system.
  virtual std::error_code replace(const std::string& source, const std::string& target) = 0;
  /// Makes a symbolic link to the text; an existing name is an error.
  virtual std::error_code linkSymbolically(const std::string& text, const std::string& path) = 0;
  /// Removes the file or link, or the directory with all below it. That there is none is no error.
  virtual std::error_code remove(const std::string& path) = 0;
};

}  // namespace zal
