#include "platform/linux/files/posix_file_placement.h"

#include <fcntl.h>
#include <stdio.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <utility>

#include "platform/linux/files/directory_tree.h"
#include "platform/linux/files/file_copy.h"
#include "platform/linux/files/own_file.h"
#include "platform/linux/files/private_directory.h"
#include "platform/linux/files/rename_no_replace.h"
#include "platform/linux/files/system_error.h"

namespace zal {

namespace {

constexpr int kMostSaveNames = 10'000;

Descriptor openFreshAt(int directory, const std::string& name) {
  constexpr int kForWriting = O_WRONLY | O_NOFOLLOW | O_CLOEXEC;
  constexpr mode_t kMode = 0666;
  struct stat status {};
  const bool isThere = ::fstatat(directory, name.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0;
  if (isThere && S_ISCHR(status.st_mode)) return Descriptor(::openat(directory, name.c_str(), kForWriting));
  if (isThere && (S_ISREG(status.st_mode) || S_ISLNK(status.st_mode))) ::unlinkat(directory, name.c_str(), 0);
  // Exclusive: who lays another link there in between makes it fail.
  return Descriptor(::openat(directory, name.c_str(), kForWriting | O_CREAT | O_EXCL, kMode));
}

/// Not through a link.
bool isFile(const std::string& path) {
  std::error_code error;
  return std::filesystem::is_regular_file(std::filesystem::symlink_status(path, error));
}

bool areOnOneFileSystem(const std::string& directory, int other) {
  struct stat here {
  }, there{};
  return ::stat(directory.c_str(), &here) == 0 && ::fstat(other, &there) == 0 && here.st_dev == there.st_dev;
}

/// By way of another name, so that the target's own never shows a half file.
std::error_code copyThrough(int directory, const std::string& name, const std::string& source,
                            const RootedPlace& target) {
  const CopyOutcome copied = copyTreeTo(directory, source, name, {.sync = true});
  std::error_code error = copied.error;
  if (!error && copied.skipped > 0) error = std::make_error_code(std::errc::operation_not_supported);
  if (!error) error = renameNoReplaceAt(directory, name, target.directory.get(), target.name);
  if (error) {
    removeTreeAt(directory, name);
    return error;
  }
  return syncDirectoryAt(target.directory.get());
}

}  // namespace

PosixFilePlacement::PosixFilePlacement(std::string homeDirectory, std::string temporaryArea,
                                       const std::vector<std::string>& roots)
    : _home(std::move(homeDirectory)),
      _temporaryParent(std::filesystem::path(temporaryArea).parent_path().string()),
      _temporaryArea(std::move(temporaryArea)),
      _paths(roots, _home) {}

std::string PosixFilePlacement::randomTemporaryPath(std::string_view suffix) {
  return _temporaryArea.path() + '/' + randomName() + std::string(suffix);
}

std::optional<std::string> PosixFilePlacement::uniqueSavePath(const std::string& path) {
  const std::filesystem::path wanted(path);
  const std::string stem = (wanted.parent_path() / wanted.stem()).string();
  const std::string extension = wanted.extension().string();
  std::string candidate = path;
  for (int number = 2; number <= kMostSaveNames + 1; ++number) {
    std::error_code error;
    if (!nameIsTaken(candidate, error)) {
      if (error == std::errc::filename_too_long) return std::nullopt;
      // Where nobody can tell, moving there does: it never overwrites, and what cannot be moved stays.
      return candidate;
    }
    candidate = stem + '-' + std::to_string(number) + extension;
  }
  return std::nullopt;
}

std::error_code PosixFilePlacement::link(const std::string& source, const std::string& target) {
  const RootedPlace to = _paths.placeOf(target);
  if (to.error) return to.error;
  if (::linkat(AT_FDCWD, source.c_str(), to.directory.get(), to.name.c_str(), 0) == 0) return {};
  const std::error_code error = lastSystemError();
  if (error != std::errc::cross_device_link || !isFile(source)) return error;
  return copyTreeTo(to.directory.get(), source, to.name, {}).error;
}

std::error_code PosixFilePlacement::rename(const std::string& source, const std::string& target) {
  const RootedPlace to = _paths.placeOf(target);
  return to.error ? to.error : renameNoReplaceAt(AT_FDCWD, source, to.directory.get(), to.name);
}

std::error_code PosixFilePlacement::move(const std::string& source, const std::string& target) {
  const RootedPlace to = _paths.placeOf(target);
  if (to.error) return to.error;
  std::error_code error = renameNoReplaceAt(AT_FDCWD, source, to.directory.get(), to.name);
  if (error != std::errc::cross_device_link) return error;
  // Across file systems the kernel says so before it looks at the target.
  if (nameIsTakenAt(to.directory.get(), to.name, error)) return std::make_error_code(std::errc::file_exists);
  if (error) return error;
  error = _copyIntoPlace(source, to);
  if (!error) std::filesystem::remove_all(source, error);
  return error;
}

// In the temporary area, where the next start finds what a kill leaves of it.
std::error_code PosixFilePlacement::_copyIntoPlace(const std::string& source, const RootedPlace& target) {
  std::error_code error = std::make_error_code(std::errc::cross_device_link);
  if (areOnOneFileSystem(_temporaryParent, target.directory.get())) {
    // A directory: a file that nobody may write is kept there for a day.
    const std::string room = randomTemporaryPath("");
    if (::mkdir(room.c_str(), S_IRWXU) == 0)
      error = copyThrough(openDirectoryAt(AT_FDCWD, room).get(), "copy", source, target);
    ::rmdir(room.c_str());
  }
  if (error != std::errc::cross_device_link) return error;
  return copyThrough(target.directory.get(), ".zal-" + randomName(), source, target);
}

std::error_code PosixFilePlacement::prepareOutput(const std::string& path) {
  // The mode that a shell gives its outputs.
  constexpr mode_t kMode = 0666;
  const RootedPlace to = _paths.placeOf(path);
  std::error_code error = to.error;
  if (!error && !openOwnFileAt(to.directory.get(), to.name, kMode).isOpen()) error = lastSystemError();
  const bool isNowhere = error == std::errc::no_such_file_or_directory || error == std::errc::not_a_directory;
  return isNowhere ? std::error_code{} : error;
}

std::error_code PosixFilePlacement::copy(const std::string& source, const std::string& target) {
  const RootedPlace to = _paths.placeOf(target);
  return to.error ? to.error : copyTreeTo(to.directory.get(), source, to.name, {}).error;
}

std::error_code PosixFilePlacement::makeDirectories(const std::string& path) {
  return _paths.makeDirectories(path);
}

std::FILE* PosixFilePlacement::openFresh(const std::string& path) {
  const RootedPlace at = _paths.placeOf(path);
  errno = at.error.value();
  Descriptor file = at.error ? Descriptor() : openFreshAt(at.directory.get(), at.name);
  std::FILE* const opened = file.isOpen() ? ::fdopen(file.get(), "wb") : nullptr;
  if (opened != nullptr) static_cast<void>(file.release());
  return opened;
}

std::error_code PosixFilePlacement::replace(const std::string& source, const std::string& target) {
  const RootedPlace from = _paths.placeOf(source);
  const RootedPlace to = _paths.placeOf(target);
  if (from.error || to.error) return from.error ? from.error : to.error;
  if (::renameat(from.directory.get(), from.name.c_str(), to.directory.get(), to.name.c_str()) == 0)
    return {};
  return lastSystemError();
}

std::error_code PosixFilePlacement::linkSymbolically(const std::string& text, const std::string& path) {
  const RootedPlace at = _paths.placeOf(path);
  if (at.error) return at.error;
  if (::symlinkat(text.c_str(), at.directory.get(), at.name.c_str()) == 0) return {};
  return lastSystemError();
}

std::error_code PosixFilePlacement::remove(const std::string& path) {
  const RootedPlace at = _paths.placeOf(path);
  if (at.error == std::errc::no_such_file_or_directory) return {};
  return at.error ? at.error : removeTreeAt(at.directory.get(), at.name);
}

}  // namespace zal
