#include "platform/linux/files/directory_tree.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <memory>

#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

constexpr int kDeepest = 100;

struct CloseDirectory {
  void operator()(DIR* directory) const { ::closedir(directory); }
};

std::uint64_t bytesAt(int parent, const std::string& name, int levels) {
  struct stat status {};
  if (::fstatat(parent, name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) return 0;
  std::uint64_t bytes = static_cast<std::uint64_t>(status.st_blocks) * kBytesOfBlock;
  if (!S_ISDIR(status.st_mode)) return bytes / std::max<std::uint64_t>(status.st_nlink, 1);
  if (levels == 0) return bytes;
  const Descriptor directory = openDirectoryAt(parent, name);
  for (const std::string& below : namesAt(directory.get()))
    bytes += bytesAt(directory.get(), below, levels - 1);
  return bytes;
}

std::error_code removeAt(int parent, const std::string& name, int levels) {
  if (::unlinkat(parent, name.c_str(), 0) == 0 || errno == ENOENT) return {};
  std::error_code error = lastSystemError();
  // Some kernels say EPERM and some EISDIR of a directory.
  if (error != std::errc::is_a_directory && error != std::errc::operation_not_permitted) return error;
  const Descriptor directory = openDirectoryAt(parent, name);
  if (!directory.isOpen()) return errno == ENOTDIR ? error : lastSystemError();
  if (levels == 0) return std::make_error_code(std::errc::filename_too_long);
  error.clear();
  for (const std::string& below : namesAt(directory.get())) {
    const std::error_code trouble = removeAt(directory.get(), below, levels - 1);
    if (!error) error = trouble;
  }
  if (::unlinkat(parent, name.c_str(), AT_REMOVEDIR) != 0 && errno != ENOENT && !error) {
    error = lastSystemError();
  }
  return error;
}

}  // namespace

Descriptor openDirectoryAt(int parent, const std::string& name) {
  return Descriptor(::openat(parent, name.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
}

std::vector<std::string> namesAt(int directory) {
  std::error_code ignored;
  return namesAt(directory, ignored);
}

std::vector<std::string> namesAt(int directory, std::error_code& error) {
  std::vector<std::string> names;
  error.clear();
  // A handle of its own: its place in the directory is not the caller's.
  Descriptor own(::openat(directory, ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  const std::unique_ptr<DIR, CloseDirectory> listing(own.isOpen() ? ::fdopendir(own.get()) : nullptr);
  if (!listing) {
    error = lastSystemError();
    return names;
  }
  static_cast<void>(own.release());
  for (;;) {
    errno = 0;
    const dirent* const entry = ::readdir(listing.get());
    if (entry == nullptr) break;
    std::string name = entry->d_name;
    if (name != "." && name != "..") names.push_back(std::move(name));
  }
  if (errno != 0) error = lastSystemError();
  std::sort(names.begin(), names.end());
  return names;
}

std::uint64_t diskBytesAt(int parent, const std::string& name) { return bytesAt(parent, name, kDeepest); }

std::error_code removeTreeAt(int parent, const std::string& name) { return removeAt(parent, name, kDeepest); }

}  // namespace zal
