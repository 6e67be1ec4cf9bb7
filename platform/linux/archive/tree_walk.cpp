#include "platform/linux/archive/tree_walk.h"

#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <memory>
#include <system_error>
#include <utility>

#include "platform/linux/archive/entry_names.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

constexpr int kOpenDirectory = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
constexpr int kOpenFile = O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC;

/// Not that the file is closed to us, is gone, or has become something else.
bool isTrouble(const std::error_code& error) {
  constexpr std::array kExpected = {EACCES, EPERM, ENOENT, ENOTDIR, ELOOP, ENXIO};
  return std::find(kExpected.begin(), kExpected.end(), error.value()) == kExpected.end();
}

const char* kindOf(mode_t mode) {
  if (S_ISFIFO(mode)) return "a pipe";
  if (S_ISSOCK(mode)) return "a socket";
  return "a device";
}

}  // namespace

TreeWalk::TreeWalk(const RootedPaths& paths, const std::string& directory, Line leftOut, Line renamed)
    : _leftOut(std::move(leftOut)), _renamed(std::move(renamed)) {
  const RootedPlace place = paths.placeOf(directory);
  if (place.error) throw std::system_error(place.error);
  Descriptor opened(::openat(place.directory.get(), place.name.c_str(), kOpenDirectory));
  if (!opened.isOpen()) throw std::system_error(lastSystemError());
  _first = _enter(std::move(opened), directory + '/', entryNames({place.name}).front() + '/');
}

std::optional<FoundEntry> TreeWalk::next() {
  if (_first) return std::exchange(_first, std::nullopt);
  while (!_open.empty()) {
    Directory& innermost = _open.back();
    if (innermost.at == innermost.names.size()) {
      _open.pop_back();
    } else if (auto found = _look(innermost, innermost.at++)) {
      return found;
    }
  }
  return std::nullopt;
}

std::optional<FoundEntry> TreeWalk::_look(const Directory& directory, std::size_t index) {
  const std::string& name = directory.names[index];
  FoundEntry found;
  found.path = directory.path + name;
  found.entry.name = directory.entryPath + (directory.entries.empty() ? name : directory.entries[index]);
  struct stat& status = found.entry.status;
  if (::fstatat(directory.opened.get(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
    _leaveOutForError(found.path);
    return std::nullopt;
  }
  if (S_ISDIR(status.st_mode)) {
    Descriptor opened(::openat(directory.opened.get(), name.c_str(), kOpenDirectory));
    if (opened.isOpen()) return _enter(std::move(opened), found.path + '/', found.entry.name + '/');
    _leaveOutForError(found.path);
    found.entry.name += '/';  // at least that it was there
    return found;
  }
  if (S_ISLNK(status.st_mode)) {
    char link[PATH_MAX];  // the kernel has no longer ones
    const ssize_t length = ::readlinkat(directory.opened.get(), name.c_str(), link, sizeof link);
    if (length < 0) {
      _leaveOutForError(found.path);
      return std::nullopt;
    }
    found.link.assign(link, static_cast<std::size_t>(length));
    return found;
  }
  if (S_ISREG(status.st_mode)) {
    found.file = Descriptor(::openat(directory.opened.get(), name.c_str(), kOpenFile));
    if (!found.file.isOpen() || ::fstat(found.file.get(), &status) != 0) {
      _leaveOutForError(found.path);
      return std::nullopt;
    }
  }
  // Also when something else took the name since it was looked at.
  if (!S_ISREG(status.st_mode)) {
    _leaveOut(found.path, kindOf(status.st_mode));
    return std::nullopt;
  }
  return found;
}

FoundEntry TreeWalk::_enter(Descriptor opened, const std::string& path, const std::string& entryPath) {
  FoundEntry found;
  found.path = path;
  found.entry.name = entryPath;
  if (::fstat(opened.get(), &found.entry.status) != 0) throw std::system_error(lastSystemError());
  Directory directory;
  directory.path = path;
  directory.entryPath = entryPath;
  directory.names = _list(opened.get(), path);
  if (!std::all_of(directory.names.begin(), directory.names.end(), isUtf8)) {
    directory.entries = entryNames(directory.names);
  }
  for (std::size_t i = 0; i < directory.entries.size(); ++i) {
    if (directory.entries[i] == directory.names[i]) continue;
    _renamed("A name in \"" + path + "\" is no UTF-8; in the archive it is \"" + directory.entries[i] + '"');
  }
  directory.opened = std::move(opened);
  _open.push_back(std::move(directory));
  return found;
}

std::vector<std::string> TreeWalk::_list(int directory, const std::string& path) {
  std::vector<std::string> names;
  Descriptor again(::openat(directory, ".", kOpenDirectory));
  const std::unique_ptr<DIR, int (*)(DIR*)> listing(again.isOpen() ? ::fdopendir(again.get()) : nullptr,
                                                    [](DIR* one) { return one ? ::closedir(one) : 0; });
  if (listing == nullptr) throw std::system_error(lastSystemError());
  [[maybe_unused]] const int ownedByListing = again.release();
  for (;;) {
    errno = 0;
    const dirent* entry = ::readdir(listing.get());
    if (entry == nullptr) break;
    std::string name = entry->d_name;
    if (name != "." && name != "..") names.push_back(std::move(name));
  }
  if (errno != 0) _leaveOutForError(path);
  std::sort(names.begin(), names.end());
  return names;
}

void TreeWalk::_leaveOut(const std::string& path, const std::string& reason) const {
  _leftOut('"' + path + "\" is left out of the archive: " + reason);
}

void TreeWalk::_leaveOutForError(const std::string& path) {
  const std::error_code error = lastSystemError();
  for (const auto ours : {std::errc::too_many_files_open, std::errc::too_many_files_open_in_system,
                          std::errc::not_enough_memory}) {
    if (error == ours) throw std::system_error(error);
  }
  _hasMissed = _hasMissed || isTrouble(error);
  _leaveOut(path, error.message());
}

}  // namespace zal
