#include "platform/linux/tessel/file_watch.h"

#include <poll.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <array>
#include <filesystem>

namespace zal::tessel {

FileWatch::FileWatch(const std::string& path)
    : _path(path), _inotify(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC)) {
  const std::filesystem::path directory = std::filesystem::path(path).parent_path();
  _watches =
      _inotify.isOpen() && ::inotify_add_watch(_inotify.get(), directory.empty() ? "." : directory.c_str(),
                                               IN_CREATE | IN_MOVED_TO) >= 0;
  addFile();
}

void FileWatch::addFile() {
  if (_watches) _watches = ::inotify_add_watch(_inotify.get(), _path.c_str(), IN_MODIFY) >= 0;
}

void FileWatch::wait() {
  constexpr int kLookAgainMs = 1000;
  pollfd waiting{_inotify.get(), POLLIN, 0};
  if (::poll(&waiting, 1, _watches ? -1 : kLookAgainMs) <= 0) return;
  // Which change it was does not matter: whoever waits looks at everything.
  std::array<char, 8192> events;
  while (::read(_inotify.get(), events.data(), events.size()) > 0) continue;
}

}  // namespace zal::tessel
