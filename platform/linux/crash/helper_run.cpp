#include "platform/linux/crash/helper_run.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <system_error>
#include <utility>

#include <asio/post.hpp>

#include "platform/linux/process/child_environment.h"
#include "platform/linux/process/child_setup.h"

namespace zal {
namespace {

constexpr std::size_t kMostSaid = 4096;

int waitFor(pid_t child, int options, int& status) {
  int ended = -1;
  do {
    ended = ::waitpid(child, &status, options);
  } while (ended < 0 && errno == EINTR);
  return ended;
}

}  // namespace

HelperRun::HelperRun(AgentLog& log, std::string what, std::shared_ptr<std::atomic<int>> running)
    : _log(log), _what(std::move(what)), _running(std::move(running)) {
  ++*_running;
}

HelperRun::~HelperRun() {
  int status = 0;
  if (_child > 0) waitFor(_child, WNOHANG, status);
  --*_running;
}

int HelperRun::start(const std::vector<std::string>& command) {
  int ends[2] = {-1, -1};
  if (::pipe2(ends, O_CLOEXEC) != 0) return errno;
  _output = Descriptor(ends[0]);
  const Descriptor theirs(ends[1]);
  ChildSetup setup;
  setup.sendOutputTo(theirs.get());
  if (const int error = setup.start(_child, command.front(), command, ChildEnvironment().pointers())) {
    _child = -1;
    return error;
  }
  // Where a process may trace its children only, this one may trace us; elsewhere it fails, unneeded.
  ::prctl(PR_SET_PTRACER, static_cast<unsigned long>(_child), 0, 0, 0);
  return 0;
}

bool HelperRun::waitForEnd(std::chrono::milliseconds most) {
  const auto end = std::chrono::steady_clock::now() + most;
  while (_child > 0) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(end - std::chrono::steady_clock::now());
    pollfd news{.fd = _output.get(), .events = POLLIN, .revents = 0};
    const int ready = ::poll(&news, 1, static_cast<int>(std::max<std::int64_t>(left.count(), 0)));
    if (ready == 0) return false;
    const ssize_t size = ready < 0 ? -1 : ::read(_output.get(), _buffer.data(), _buffer.size());
    if (size < 0 && errno == EINTR) continue;
    if (size > 0) {
      _take(static_cast<std::size_t>(size));
    } else {
      _bury();
    }
  }
  return true;
}

void HelperRun::leaveTo(asio::io_context& loop) {
  asio::post(loop, [self = shared_from_this(), &loop] {
    const auto output = std::make_shared<asio::posix::stream_descriptor>(loop, self->_output.release());
    self->_readMore(output);
  });
}

void HelperRun::_readMore(const std::shared_ptr<asio::posix::stream_descriptor>& output) {
  output->async_read_some(asio::buffer(_buffer), [self = shared_from_this(), output](
                                                     const std::error_code& error, std::size_t size) {
    self->_take(size);
    if (error == std::errc::operation_canceled) return;
    if (error) {
      self->_bury();
    } else {
      self->_readMore(output);
    }
  });
}

void HelperRun::_take(std::size_t size) {
  _said.append(_buffer.data(), std::min(size, kMostSaid - std::min(kMostSaid, _said.size())));
}

// Nobody else holds the pipe, so its end means that the program is gone or as good as gone.
void HelperRun::_bury() {
  int status = 0;
  const int ended = waitFor(std::exchange(_child, -1), 0, status);
  while (!_said.empty() && _said.back() == '\n') _said.pop_back();
  if (ended > 0 && WIFEXITED(status) && WEXITSTATUS(status) == 0) {
    _log.notice("Crash service: wrote " + _said);
    return;
  }
  if (_said.empty() && ended > 0 && WIFSIGNALED(status))
    _said = "ended by signal " + std::to_string(WTERMSIG(status));
  _log.warning("Crash service: no " + _what + ": " + (_said.empty() ? "it gave up" : _said));
}

}  // namespace zal
