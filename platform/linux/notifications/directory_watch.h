#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <system_error>

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
  void _handle(int watch, std::uint32_t mask, std::string_view name);
  void _establish();
  void _reportExisting();
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
  bool _wasEstablished = false;
  bool _complained = false;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards handlers in flight
};

}  // namespace zal
