#include "platform/linux/ping/linux_ping_test.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <system_error>
#include <utility>

#include <asio/post.hpp>

#include "platform/linux/files/own_file.h"
#include "platform/linux/files/whole_file.h"
#include "platform/linux/ping/ping_attempt.h"

namespace zal {
namespace {

std::chrono::nanoseconds durationOf(double seconds) {
  if (!(seconds > 0)) return std::chrono::nanoseconds{0};
  return std::chrono::duration_cast<std::chrono::nanoseconds>(
      std::chrono::duration<double>(std::min(seconds, LinuxPingTest::kLongestSeconds)));
}

}  // namespace

LinuxPingTest::LinuxPingTest(asio::io_context& context, AgentLog& log, std::string address,
                             std::string interface, PingMethods methods, const RootedPaths& paths)
    : _context(context),
      _log(log),
      _host(std::move(address)),
      _interface(std::move(interface)),
      _methods(std::move(methods)),
      _paths(paths),
      _report(std::make_shared<PingReport>(_host)) {}

void LinuxPingTest::startWithTimeout(double seconds, WorkQueue& queue, CompletionHandler handler) {
  _secondsToRun = seconds;
  PingTask task{_host, _interface, _methods, durationOf(seconds), _report, &queue, std::move(handler)};
  asio::post(_context, [self = shared_from_this(), task = std::move(task)]() mutable {
    const auto attempt = std::make_shared<PingAttempt>(self->_context, self->_log, std::move(task));
    self->_attempt = attempt;
    attempt->begin();
  });
}

void LinuxPingTest::stop() {
  asio::post(_context, [self = shared_from_this()] {
    if (const auto attempt = self->_attempt.lock()) attempt->end();
  });
}

// The path is known beforehand and may lie in a directory that everybody writes to: a link that
// somebody laid there must not turn us against another file.
bool LinuxPingTest::writeResultsToFile(const std::string& path, std::string& error) {
  constexpr mode_t kMode = 0644;
  const RootedPlace at = _paths.placeOf(path);
  errno = at.error.value();
  const Descriptor file = at.error ? Descriptor() : openOwnFileAt(at.directory.get(), at.name, kMode);
  if (file.isOpen() && (::ftruncate(file.get(), 0) == 0 || errno == EINVAL) &&
      !writeWhole(file.get(), _report->text()))
    return true;
  error = std::generic_category().message(errno);
  return false;
}

}  // namespace zal
