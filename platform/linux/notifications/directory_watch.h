#pragma once

#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>

#include <asio/io_context.hpp>
#include <asio/posix/stream_descriptor.hpp>

namespace zal {

/// Sees files being renamed into one directory, also after that directory was removed and came
/// back: it makes the directory again, and where it cannot, it waits for a change of the nearest
/// directory above. Never polls. Handlers run on the io_context's thread, which also owns this.
class DirectoryWatch {
 public:
  struct Handlers {
    std::function<void(std::string_view name)> onArrival;
    /// Arrivals may have been missed: the queue overflowed.
    std::function<void()> onOverflow;
    std::function<void(std::string_view problem)> onProblem;  ///< once per outage
    /// Called in onArrival's place where it is set: with the name that the file had in the directory
    /// before, empty when it came from elsewhere or came while nobody looked.
    std::function<void(std::string_view name, std::string_view formerName)> onRename = nullptr;
  };
  /// The directory is made, if need be, by `makeDirectory` and looked at from now on.
  DirectoryWatch(asio::io_context& context, std::string directory,
                 std::function<std::error_code(const std::string&)> makeDirectory, Handlers handlers);
  ~DirectoryWatch();
  DirectoryWatch(const DirectoryWatch&) = delete;
  DirectoryWatch& operator=(const DirectoryWatch&) = delete;

 private:
  void _await();
  void _readEvents();
  void _handle(int watch, std::uint32_t mask, std::uint32_t cookie, std::string_view name);
  void _establish();
  void _reportExisting();
  void _noteDeparture(std::uint32_t cookie, std::string_view name);
  [[nodiscard]] std::string _takeDeparture(std::uint32_t cookie);
  void _report(std::string_view name, std::string_view formerName);
  bool _addWatches();
  void _watchNearestAncestor();
  void _dropWatches();
  void _complain(const std::string& problem);

  std::string _directory;
  std::function<std::error_code(const std::string&)> _makeDirectory;
  Handlers _handlers;
  asio::posix::stream_descriptor _inotify;
  int _directoryWatch = -1;
  int _outerWatch = -1;  // the parent, or the nearest directory there is
  std::deque<std::pair<std::uint32_t, std::string>> _departures;  // the first halves of renames
  bool _wasEstablished = false;
  bool _complained = false;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards handlers in flight
};

}  // namespace zal
