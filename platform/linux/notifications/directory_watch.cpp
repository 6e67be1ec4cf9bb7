#include "platform/linux/notifications/directory_watch.h"

#include <sys/inotify.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <system_error>
#include <vector>

namespace zal {
namespace {

constexpr std::uint32_t kLost = IN_DELETE_SELF | IN_MOVE_SELF | IN_UNMOUNT;
constexpr std::uint32_t kChangedInside = IN_CREATE | IN_MOVED_TO | IN_DELETE | IN_MOVED_FROM;
/// Renames whose second half is still awaited; those of files that left the directory never have one.
constexpr std::size_t kMostDepartures = 64;

}  // namespace

DirectoryWatch::DirectoryWatch(asio::io_context& context, std::string directory,
                               std::function<std::error_code(const std::string&)> makeDirectory,
                               Handlers handlers)
    : _directory(std::move(directory)),
      _makeDirectory(std::move(makeDirectory)),
      _handlers(std::move(handlers)),
      _inotify(context) {
  const int descriptor = ::inotify_init1(IN_NONBLOCK | IN_CLOEXEC);
  if (descriptor < 0) {
    _complain(std::string("no watch can be had: ") + std::generic_category().message(errno));
    return;
  }
  _inotify.assign(descriptor);
  _establish();
  _await();
}

DirectoryWatch::~DirectoryWatch() = default;

void DirectoryWatch::_await() {
  _inotify.async_wait(asio::posix::descriptor_base::wait_read,
                      [this, alive = std::weak_ptr<bool>(_alive)](const std::error_code& error) {
                        if (error || alive.expired()) return;
                        _readEvents();
                        if (!alive.expired()) _await();
                      });
}

void DirectoryWatch::_readEvents() {
  const std::weak_ptr<bool> alive = _alive;
  alignas(inotify_event) std::array<char, 8192> buffer;
  for (;;) {
    const ssize_t length = ::read(_inotify.native_handle(), buffer.data(), buffer.size());
    if (length < 0 && errno == EINTR) continue;
    if (length <= 0) return;
    for (std::size_t offset = 0; offset < static_cast<std::size_t>(length);) {
      inotify_event event;
      std::memcpy(&event, buffer.data() + offset, sizeof event);
      const char* name = buffer.data() + offset + sizeof event;
      _handle(event.wd, event.mask, event.cookie,
              event.len == 0 ? std::string_view() : std::string_view(name));
      if (alive.expired()) return;
      offset += sizeof event + event.len;
    }
  }
}

void DirectoryWatch::_handle(int watch, std::uint32_t mask, std::uint32_t cookie, std::string_view name) {
  if ((mask & IN_Q_OVERFLOW) != 0) {
    // The end of a watch may be among what was lost.
    _establish();
    _handlers.onOverflow();
    return;
  }
  if (watch == _directoryWatch && (mask & kLost) == 0) {
    if ((mask & IN_MOVED_FROM) != 0) _noteDeparture(cookie, name);
    if ((mask & IN_MOVED_TO) != 0) _report(name, _takeDeparture(cookie));
    return;
  }
  // What is left over of watches that were given up says nothing new.
  if (watch == _directoryWatch || watch == _outerWatch) _establish();
}

void DirectoryWatch::_noteDeparture(std::uint32_t cookie, std::string_view name) {
  if (_departures.size() == kMostDepartures) _departures.pop_front();
  _departures.emplace_back(cookie, name);
}

std::string DirectoryWatch::_takeDeparture(std::uint32_t cookie) {
  for (auto place = _departures.begin(); place != _departures.end(); ++place) {
    if (place->first != cookie) continue;
    std::string name = std::move(place->second);
    _departures.erase(place);
    return name;
  }
  return "";
}

void DirectoryWatch::_report(std::string_view name, std::string_view formerName) {
  _handlers.onRename ? _handlers.onRename(name, formerName) : _handlers.onArrival(name);
}

void DirectoryWatch::_establish() {
  _dropWatches();
  // The directory may go again between the steps; what is then left to wait for is a change above.
  const std::error_code error = _makeDirectory(_directory);
  if (!error && _addWatches()) {
    _complained = false;
    if (_wasEstablished) _reportExisting();
    _wasEstablished = true;
    return;
  }
  _complain(_directory +
            ": cannot be watched: " + (error ? error.message() : std::generic_category().message(errno)));
  _wasEstablished = true;  // from here on, whatever is found in it arrived unseen
  _watchNearestAncestor();
}

/// Files that are there already when the watch comes back arrived while nobody looked.
void DirectoryWatch::_reportExisting() {
  std::vector<std::string> names;
  std::error_code error;
  for (std::filesystem::directory_iterator entry(_directory, error), end; !error && entry != end;
       entry.increment(error)) {
    names.push_back(entry->path().filename().string());
  }
  const std::weak_ptr<bool> alive = _alive;
  for (const std::string& name : names) {
    _report(name, "");
    if (alive.expired()) return;
  }
}

bool DirectoryWatch::_addWatches() {
  const int descriptor = _inotify.native_handle();
  const std::string parent = std::filesystem::path(_directory).parent_path().string();
  const std::uint32_t renames = _handlers.onRename ? IN_MOVED_FROM | IN_MOVED_TO : IN_MOVED_TO;
  _directoryWatch = ::inotify_add_watch(descriptor, _directory.c_str(), renames | kLost | IN_ONLYDIR);
  if (_directoryWatch < 0) return false;
  // A parent that is moved takes our directory with it and tells only its own watchers.
  _outerWatch = ::inotify_add_watch(descriptor, parent.c_str(), kLost | IN_ONLYDIR);
  return _outerWatch >= 0;
}

void DirectoryWatch::_watchNearestAncestor() {
  std::filesystem::path ancestor = _directory;
  while (ancestor.has_relative_path()) {
    ancestor = ancestor.parent_path();
    _outerWatch = ::inotify_add_watch(_inotify.native_handle(), ancestor.c_str(),
                                      kChangedInside | IN_ATTRIB | kLost | IN_ONLYDIR);
    if (_outerWatch >= 0) return;
  }
}

void DirectoryWatch::_dropWatches() {
  for (int* watch : {&_directoryWatch, &_outerWatch}) {
    if (*watch >= 0) ::inotify_rm_watch(_inotify.native_handle(), *watch);
    *watch = -1;
  }
}

void DirectoryWatch::_complain(const std::string& problem) {
  if (_complained) return;
  _complained = true;
  _handlers.onProblem(problem);
}

}  // namespace zal
