#include "platform/linux/files/temporary_area.h"

#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <string_view>

#include "platform/linux/files/directory_names.h"
#include "platform/linux/files/directory_tree.h"
#include "platform/linux/files/private_directory.h"

namespace zal {
namespace {

constexpr std::size_t kRandomDigits = 32;

bool isSame(int opened, const std::string& path) {
  struct stat here {
  }, there{};
  return ::fstat(opened, &here) == 0 && ::lstat(path.c_str(), &there) == 0 && here.st_dev == there.st_dev &&
         here.st_ino == there.st_ino;
}

bool isRandomEnding(std::string_view text) {
  return text.size() == kRandomDigits + 1 && text[0] == '-' &&
         text.find_first_not_of("0123456789abcdef", 1) == std::string_view::npos;
}

}  // namespace

std::string TemporaryArea::path() {
  const std::scoped_lock lock(_mutex);
  if (_held.isOpen() && isSame(_held.get(), _path)) return _path;
  if (_hold(_base, true)) return _path;
  const std::string beside = _base + '-' + randomName();
  return _hold(beside, false) ? _path : beside;
}

bool TemporaryArea::_hold(const std::string& path, bool onlyEmpty) {
  _held = {};
  if (!ensurePrivateDirectory(path)) return false;
  Descriptor directory = openDirectoryAt(-1, path);
  // Who cleans up may have been faster: then it is another directory by now, or none.
  if (!directory.isOpen() || ::flock(directory.get(), LOCK_EX | LOCK_NB) != 0 ||
      !isSame(directory.get(), path) || (onlyEmpty && !namesAt(directory.get()).empty())) {
    return false;
  }
  _held = std::move(directory);
  _path = path;
  return true;
}

std::vector<std::string> temporaryAreaNames(const std::string& base) {
  const std::filesystem::path path(base);
  const std::string own = path.filename().string();
  std::vector<std::string> names = namesIn(path.parent_path().string());
  std::erase_if(names, [&](const std::string& name) {
    return name != own &&
           !(name.starts_with(own) && isRandomEnding(std::string_view(name).substr(own.size())));
  });
  return names;
}

Descriptor holdDeserted(int parent, const std::string& name) {
  Descriptor directory = openDirectoryAt(parent, name);
  struct stat status {};
  if (!directory.isOpen() || ::fstat(directory.get(), &status) != 0 || status.st_uid != ::geteuid() ||
      ::flock(directory.get(), LOCK_EX | LOCK_NB) != 0) {
    return {};
  }
  return directory;
}

}  // namespace zal
