#pragma once

#include <optional>
#include <string>
#include <system_error>
#include <vector>

#include "platform/directory_roots.h"

namespace zal {

class AgentLog;
class FilePlacement;
class GatheringWitnesses;
enum class SourceOutcome;

/// Brings files into a dump or session directory. Single files are hard-linked, so that they cost no
/// space and still grow with their writer (copied where they lie on another file system); whole
/// directories are copied. Nothing is ever overwritten. Source paths may begin with "~". Everybody writes to
/// TemporaryRoot: a single file below it is taken only when no symbolic link leads to it; the log names one
/// that is refused. Any thread; keeps no state; may wait for a disk.
class FileCollector {
 public:
  /// The services and the roots are borrowed, and so are the witnesses, if there are any.
  FileCollector(FilePlacement& files, AgentLog& log, const DirectoryRoots& roots,
                const GatheringWitnesses* witnesses = nullptr)
      : _files(files), _log(log), _roots(roots), _witnesses(witnesses) {}

  /// Links the file, symbolic links followed, under its own name plus the suffix; missing parents
  /// are made with mode 0777. Returned: whether it was placed. A missing source makes nothing; a
  /// taken name or a refusal are not logged.
  bool LinkFileIntoDirectory(const std::string& source, const std::string& directory,
                             const std::string& suffix);
  /// Links every entry whose name begins with the prefix, hidden ones included, not what is below
  /// them. Returned: whether all of them were linked; true for a directory that cannot be read.
  bool LinkDirectoryEntriesWithPrefix(const std::string& sourceDirectory, const std::string& prefix,
                                      const std::string& directory);
  /// The same by the end of the name; here a leading "~" of the source directory is not expanded.
  bool LinkDirectoryEntriesWithSuffix(const std::string& sourceDirectory, const std::string& suffix,
                                      const std::string& directory);
  /// Moves the file under its own name plus the suffix, or a free variant of it when that is taken.
  /// Returned: false when there is no such file or it could not be moved and so stays. When no free
  /// name can be found the file is removed.
  bool MoveFileIntoDirectory(const std::string& source, const std::string& directory,
                             const std::string& suffix);
  /// The same as far as it is quick: nothing, and nothing happens, where the file would have to be copied to
  /// another file system.
  std::optional<bool> MoveFileWithinFileSystem(const std::string& source, const std::string& directory,
                                               const std::string& suffix);

  /// Makes the directory with all missing parents, with mode 0777. Returned: why it is not there.
  std::error_code makeDirectory(const std::string& directory);

  /// Copies files and directories of a directory into another, which must exist; hidden ones and
  /// compressed older logs stay out, those of "beacond" excepted. Failures are logged; after the
  /// first, every later entry is logged as well, with the error that came last.
  void CopyDirectoryContents(const std::string& sourceDirectory, const std::string& directory);
  /// Copies the files of DiagnosticReportRoot whose names contain one of the fragments, in any case
  /// of ASCII letters. Failures are logged as above.
  void CopyCrashReportsMatching(const std::vector<std::string>& fragments, const std::string& directory);

 private:
  [[nodiscard]] std::string _resolved(const std::string& path) const;
  /// The source as a path without links; empty, and told, when there is nothing to take.
  [[nodiscard]] std::string _source(const std::string& path, const std::string& directory) const;
  enum class Reach { fileSystem, anywhere };
  std::optional<bool> _move(const std::string& source, const std::string& directory,
                            const std::string& suffix, Reach reach);
  bool _linkEntry(const std::string& sourceDirectory, const std::string& name, const std::string& directory);
  void _makeParent(const std::string& target);
  void _copy(const std::string& source, const std::string& target, std::error_code& errorSlot);
  void _tell(const std::string& source, const std::string& directory, SourceOutcome outcome) const;
  /// A name that is taken already counts as no failure: what lies there is the same source, or came first.
  void _tell(const std::string& source, const std::string& directory, const std::error_code& error) const;

  FilePlacement& _files;
  AgentLog& _log;
  const DirectoryRoots& _roots;
  const GatheringWitnesses* const _witnesses;
};

}  // namespace zal
