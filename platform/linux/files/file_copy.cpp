#include "platform/linux/files/file_copy.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <memory>
#include <optional>
#include <utility>
#include <vector>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/file_content.h"
#include "platform/linux/files/system_error.h"

namespace zal {

namespace {

// Without set-user-id and set-group-id: the copy is ours, and would lend our rights to its reader.
constexpr mode_t kPermissionBits = S_IRWXU | S_IRWXG | S_IRWXO;
constexpr mode_t kOwnMode = S_IRUSR | S_IWUSR;
constexpr int kOpenSource = O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;
constexpr int kOpenDirectory = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;

/// A name in an open directory: a path that cannot be led elsewhere by a link put in its way.
struct Place {
  int directory;
  const char* name;
};

/// A file beside the target that is gone with us unless it gets a name: whoever sees the target sees it
/// whole. Some file systems have none.
Descriptor openNameless(Place target) {
  const std::string name = target.name;
  const std::size_t slash = name.rfind('/');
  const std::string parent = slash == std::string::npos ? "." : name.substr(0, slash + 1);
  return Descriptor(::openat(target.directory, parent.c_str(), O_TMPFILE | O_WRONLY | O_CLOEXEC, kOwnMode));
}

/// A target that is there already stays as it is.
std::error_code giveName(const Descriptor& file, Place target) {
  const std::string nameless = "/proc/self/fd/" + std::to_string(file.get());
  if (::linkat(AT_FDCWD, nameless.c_str(), target.directory, target.name, AT_SYMLINK_FOLLOW) == 0) return {};
  return lastSystemError();
}

class TreeCopy {
 public:
  explicit TreeCopy(CopyOptions options) : _options(options) {}

  void copy(Place source, Place target) {
    struct stat status {};
    if (::fstatat(source.directory, source.name, &status, AT_SYMLINK_NOFOLLOW) != 0) {
      _note(lastSystemError());
    } else if (S_ISREG(status.st_mode)) {
      _note(_copyFile(source, target));
    } else if (S_ISLNK(status.st_mode)) {
      _note(_copyLink(source, target, status));
    } else if (S_ISDIR(status.st_mode)) {
      _note(_copyDirectory(source, target));
    } else if (_targetRoot) {
      ++_outcome.skipped;
    } else {
      _note(std::make_error_code(std::errc::operation_not_supported));
    }
  }
  [[nodiscard]] const CopyOutcome& outcome() const { return _outcome; }

 private:
  void _note(const std::error_code& error) {
    if (error && !_outcome.error) _outcome.error = error;
  }

  /// Last, because writing moves the time, and a directory may get a mode that forbids writing.
  std::error_code _finish(int target, const struct stat& status) {
    const timespec times[2] = {status.st_atim, status.st_mtim};
    if (::fchmod(target, status.st_mode & kPermissionBits) != 0) return lastSystemError();
    if (::futimens(target, times) != 0) return lastSystemError();
    if (_options.sync && ::fsync(target) != 0) return lastSystemError();
    return {};
  }

  std::error_code _copyFile(Place source, Place target) {
    const Descriptor from(::openat(source.directory, source.name, kOpenSource));
    if (!from.isOpen()) return lastSystemError();
    struct stat status {};
    if (::fstat(from.get(), &status) != 0) return lastSystemError();
    // Something else may have taken the name since it was looked at.
    if (!S_ISREG(status.st_mode)) return std::make_error_code(std::errc::operation_not_supported);
    struct stat present {};
    if (::fstatat(target.directory, target.name, &present, AT_SYMLINK_NOFOLLOW) == 0)
      return std::make_error_code(std::errc::file_exists);
    Descriptor to = openNameless(target);
    const bool isNameless = to.isOpen();
    if (!isNameless) {
      to = Descriptor(
          ::openat(target.directory, target.name, O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, kOwnMode));
    }
    if (!to.isOpen()) return lastSystemError();
    std::error_code error = copyFileContent(from.get(), to.get());
    if (!error) error = _finish(to.get(), status);
    if (!error && isNameless) error = giveName(to, target);
    if (::close(to.release()) != 0 && !error) error = lastSystemError();
    if (error && !isNameless) ::unlinkat(target.directory, target.name, 0);
    return error;
  }

  static std::error_code _copyLink(Place source, Place target, const struct stat& status) {
    // Room for more than the link says it has: generated ones say 0, and it may grow meanwhile.
    std::vector<char> text(static_cast<std::size_t>(status.st_size) + 4096);
    const ssize_t length = ::readlinkat(source.directory, source.name, text.data(), text.size());
    if (length < 0) return lastSystemError();
    if (static_cast<std::size_t>(length) == text.size()) {
      return std::make_error_code(std::errc::filename_too_long);
    }
    text[static_cast<std::size_t>(length)] = '\0';
    if (::symlinkat(text.data(), target.directory, target.name) != 0) return lastSystemError();
    const timespec times[2] = {status.st_atim, status.st_mtim};
    ::utimensat(target.directory, target.name, times, AT_SYMLINK_NOFOLLOW);
    return {};
  }

  std::error_code _copyDirectory(Place source, Place target) {
    Descriptor from(::openat(source.directory, source.name, kOpenDirectory));
    struct stat status {};
    if (!from.isOpen() || ::fstat(from.get(), &status) != 0) return lastSystemError();
    if (_targetRoot == Identity{status.st_dev, status.st_ino}) return {};  // the copy itself
    if (::mkdirat(target.directory, target.name, S_IRWXU) != 0) return lastSystemError();
    const Descriptor to(::openat(target.directory, target.name, kOpenDirectory));
    struct stat made {};
    if (!to.isOpen() || ::fstat(to.get(), &made) != 0) return lastSystemError();
    if (!_targetRoot) _targetRoot = Identity{made.st_dev, made.st_ino};

    const std::unique_ptr<DIR, int (*)(DIR*)> listing(::fdopendir(from.get()), &::closedir);
    if (!listing) return lastSystemError();
    const int directory = from.release();  // the listing closes it
    for (;;) {
      errno = 0;
      const dirent* entry = ::readdir(listing.get());
      if (entry == nullptr) break;
      const std::string name = entry->d_name;
      if (name != "." && name != "..") copy({directory, name.c_str()}, {to.get(), name.c_str()});
    }
    if (errno != 0) _note(lastSystemError());
    return _finish(to.get(), status);
  }

  using Identity = std::pair<dev_t, ino_t>;
  const CopyOptions _options;
  std::optional<Identity> _targetRoot;  // the outermost directory made, once there is one
  CopyOutcome _outcome;
};

}  // namespace

CopyOutcome copyTree(const std::string& source, const std::string& target, CopyOptions options) {
  return copyTreeTo(AT_FDCWD, source, target, options);
}

CopyOutcome copyTreeTo(int directory, const std::string& source, const std::string& target,
                       CopyOptions options) {
  TreeCopy copy(options);
  copy.copy({AT_FDCWD, source.c_str()}, {directory, target.c_str()});
  return copy.outcome();
}

std::error_code syncDirectory(const std::string& directory) {
  const Descriptor opened(::open(directory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
  return opened.isOpen() ? syncDirectoryAt(opened.get()) : lastSystemError();
}

std::error_code syncDirectoryAt(int directory) {
  const Descriptor listed(::openat(directory, ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!listed.isOpen() || ::fsync(listed.get()) != 0) return lastSystemError();
  return {};
}

}  // namespace zal
