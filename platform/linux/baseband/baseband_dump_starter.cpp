#include "platform/linux/baseband/baseband_dump_starter.h"

#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <mutex>
#include <system_error>
#include <utility>

#include <asio/posix/stream_descriptor.hpp>
#include <asio/post.hpp>

#include "platform/linux/baseband/hand_off_marker.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/escaped_text.h"
#include "platform/linux/process/child_environment.h"
#include "platform/linux/process/child_setup.h"
#include "platform/linux/process/process_descriptor.h"

namespace zal {

class BasebandDumpStarter::State : public std::enable_shared_from_this<State> {
 public:
  State(asio::io_context& loop, AgentLog& log, Places places)
      : _loop(loop), _log(log), _places(std::move(places)) {}

  void start(std::string_view reason) {
    const std::scoped_lock lock(_lock);
    _takeBackIfEnded();
    if (_child > 0) {
      _log.notice("A baseband dump is being written already; it stands for this one too");
      return;
    }
    if (const auto error = _places.paths.makeDirectories(_places.directory)) {
      _log.warning("Baseband dump: cannot make " + _places.directory + ": " + error.message());
      return;
    }
    if (const auto error = HandOffMarker::place(_places.marker))
      _log.warning("Cannot make " + _places.marker + ": " + error.message());
    const std::string text(cutAtCharacter(reason, kLongestReason));
    const int error = ChildSetup().start(
        _child, _places.helper,
        {_places.helper, "--directory", _places.directory, "--marker", _places.marker, "--reason", text},
        ChildEnvironment().pointers());
    if (error == 0) {
      _watch();
      return;
    }
    _child = -1;
    HandOffMarker::removeUnlessHeld(_places.marker);
    _log.warning("Baseband dump: cannot start " + _places.helper + ": " +
                 std::generic_category().message(error));
  }

  /// What still runs goes on; its end is nobody's any more.
  void close() {
    const std::scoped_lock lock(_lock);
    _closed = true;
  }

 private:
  // With _lock held.
  void _watch() {
    Descriptor process = processDescriptor(_child);
    if (!process.isOpen()) return;  // an old kernel: the next start takes it back
    asio::post(_loop, [self = shared_from_this(), process = std::move(process)]() mutable {
      const auto end = std::make_shared<asio::posix::stream_descriptor>(self->_loop, process.release());
      end->async_wait(asio::posix::stream_descriptor::wait_read, [self, end](const std::error_code& gone) {
        const std::scoped_lock lock(self->_lock);
        if (!gone && !self->_closed) self->_takeBackIfEnded();
      });
    });
  }

  // With _lock held.
  void _takeBackIfEnded() {
    int status = 0;
    if (_child <= 0 || ::waitpid(_child, &status, WNOHANG) != _child) return;
    _child = -1;
    HandOffMarker::removeUnlessHeld(_places.marker);
    if (WIFSIGNALED(status)) {
      _log.warning("Baseband dump: the program was ended by signal " + std::to_string(WTERMSIG(status)));
    } else if (WEXITSTATUS(status) != 0) {
      _log.warning("Baseband dump: the program ended with status " + std::to_string(WEXITSTATUS(status)));
    }
  }

  asio::io_context& _loop;
  AgentLog& _log;
  const Places _places;
  std::mutex _lock;
  pid_t _child = -1;     // -1: none runs. Guarded by _lock, as is the next one
  bool _closed = false;  // the log may be gone
};

BasebandDumpStarter::BasebandDumpStarter(asio::io_context& loop, AgentLog& log, Places places)
    : _state(std::make_shared<State>(loop, log, std::move(places))) {}

BasebandDumpStarter::~BasebandDumpStarter() { _state->close(); }

void BasebandDumpStarter::start(std::string_view reason) { _state->start(reason); }

}  // namespace zal
