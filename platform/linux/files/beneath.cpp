#include "platform/linux/files/beneath.h"

#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <optional>
#include <vector>

#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

constexpr int kLookUp = O_PATH | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
constexpr mode_t kOpenToAll = S_IRWXU | S_IRWXG | S_IRWXO;

/// The names on the way. Nothing, and errno, when the path is none that can lead below.
std::optional<std::vector<std::string>> stepsOf(const std::string& path) {
  std::vector<std::string> steps;
  errno = path.starts_with('/') ? EXDEV : 0;
  if (path.find('\0') != std::string::npos) errno = EINVAL;
  for (const auto& component : std::filesystem::path(path)) {
    if (component == "..") errno = EXDEV;
    if (!component.empty() && component != ".") steps.push_back(component.string());
  }
  if (errno != 0) return std::nullopt;
  return steps;
}

Descriptor openStep(int directory, const std::string& name) {
  Descriptor opened(::openat(directory, name.c_str(), kLookUp));
  if (opened.isOpen() || errno != ENOTDIR) return opened;
  struct stat status {};
  const bool isLink =
      ::fstatat(directory, name.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0 && S_ISLNK(status.st_mode);
  errno = isLink ? ELOOP : ENOTDIR;
  return {};
}

Descriptor openInSteps(int directory, const std::vector<std::string>& steps) {
  Descriptor reached(::openat(directory, ".", kLookUp));
  for (const std::string& name : steps) {
    if (!reached.isOpen()) break;
    reached = openStep(reached.get(), name);
  }
  return reached;
}

Descriptor openInOneCall(int directory, const std::string& path) {
  open_how how{};
  // With O_NOFOLLOW a link at the end would itself be opened, and then be no directory.
  how.flags = static_cast<decltype(how.flags)>(kLookUp & ~O_NOFOLLOW);
  how.resolve = RESOLVE_BENEATH | RESOLVE_NO_SYMLINKS | RESOLVE_NO_MAGICLINKS;
  const char* const text = path.empty() ? "." : path.c_str();
  return Descriptor(static_cast<int>(::syscall(SYS_openat2, directory, text, &how, sizeof how)));
}

Descriptor makeStep(int directory, const std::string& name) {
  if (::mkdirat(directory, name.c_str(), kOpenToAll) != 0) {
    return errno == EEXIST ? openStep(directory, name) : Descriptor();  // somebody else was faster
  }
  Descriptor made(::openat(directory, name.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
  if (made.isOpen() && ::fchmod(made.get(), kOpenToAll) != 0) return {};
  return made;
}

}  // namespace

Descriptor openDirectoryBeneath(int directory, const std::string& path, WayDown way) {
  const auto steps = stepsOf(path);
  if (!steps) return {};
  if (way == WayDown::inOneCall) {
    Descriptor opened = openInOneCall(directory, path);
    // An old kernel; a filter that does not know the call.
    if (opened.isOpen() || (errno != ENOSYS && errno != EPERM)) return opened;
  }
  return openInSteps(directory, *steps);
}

std::error_code makeDirectoriesBeneath(int directory, const std::string& path) {
  if (openDirectoryBeneath(directory, path).isOpen()) return {};
  if (errno != ENOENT) return lastSystemError();
  const auto steps = stepsOf(path);
  if (!steps) return lastSystemError();
  Descriptor reached(::openat(directory, ".", kLookUp));
  for (const std::string& name : *steps) {
    if (!reached.isOpen()) break;
    Descriptor next = openStep(reached.get(), name);
    if (!next.isOpen() && errno == ENOENT) next = makeStep(reached.get(), name);
    reached = std::move(next);
  }
  return reached.isOpen() ? std::error_code{} : lastSystemError();
}

}  // namespace zal
