#include "platform/linux/ping/linux_ping_test.h"

#include <fcntl.h>
#include <net/if.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <system_error>
#include <utility>

#include <asio/post.hpp>

#include "platform/agent_log.h"
#include "platform/linux/ipc/descriptor.h"
#include "platform/linux/ping/echo_run.h"
#include "platform/linux/ping/interface_binding.h"
#include "platform/linux/ping/ping_text.h"
#include "platform/linux/ping/program_run.h"
#include "platform/linux/ping/route_table.h"

namespace zal {
namespace {

constexpr std::string_view kLogCategory = "Ping";

std::chrono::nanoseconds durationOf(double seconds) {
  if (!(seconds > 0)) return std::chrono::nanoseconds{0};
  return std::chrono::duration_cast<std::chrono::nanoseconds>(
      std::chrono::duration<double>(std::min(seconds, LinuxPingTest::kLongestSeconds)));
}

/// A link-local address means nothing without the link.
asio::ip::address withScope(const asio::ip::address& address, const std::string& interface) {
  if (!address.is_v6() || !address.to_v6().is_link_local() || address.to_v6().scope_id() != 0) return address;
  asio::ip::address_v6 scoped = address.to_v6();
  scoped.scope_id(::if_nametoindex(interface.c_str()));
  return scoped;
}

bool writeWhole(int file, std::string_view text) {
  while (!text.empty()) {
    const ssize_t written = ::write(file, text.data(), text.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) return false;
    text.remove_prefix(static_cast<std::size_t>(written));
  }
  return true;
}

}  // namespace

LinuxPingTest::LinuxPingTest(asio::io_context& context, AgentLog& log, std::string address,
                             std::string interface, PingMethods methods)
    : _context(context),
      _log(log),
      _host(std::move(address)),
      _interface(std::move(interface)),
      _methods(std::move(methods)),
      _report(std::make_shared<PingReport>(_host)),
      _resolver(context),
      _deadline(context) {}

void LinuxPingTest::startWithTimeout(double seconds, WorkQueue& queue, CompletionHandler handler) {
  _secondsToRun = seconds;
  asio::post(_context, [self = shared_from_this(), seconds, &queue, handler = std::move(handler)]() mutable {
    self->_duration = durationOf(seconds);
    self->_queue = &queue;
    self->_handler = std::move(handler);
    self->_begin();
  });
}

void LinuxPingTest::stop() {
  asio::post(_context, [self = shared_from_this()] { self->_timeIsOver(); });
}

// The path is known beforehand and may lie in a directory that everybody writes to: a link that
// somebody laid there must not turn us against another file.
bool LinuxPingTest::writeResultsToFile(const std::string& path, std::string& error) {
  constexpr mode_t kMode = 0644;
  const Descriptor file(
      ::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC, kMode));
  if (file.isOpen() && writeWhole(file.get(), _report->text())) return true;
  error = std::generic_category().message(errno);
  return false;
}

void LinuxPingTest::_begin() {
  _armDeadline(_duration);
  if (::if_nametoindex(_interface.c_str()) == 0) {
    _fail("there is no interface " + _interface);
  } else if (_host == kDefaultGatewayAddress) {
    const auto route = currentDefaultRoute(_interface);
    if (!route) {
      _fail("no route to a gateway: " + _interface + " has no default route");
    } else if (!route->gateway) {
      _fail("no gateway to ping: the default route of " + _interface + " is a point-to-point link");
    } else {
      _pingFirstReachable({*route->gateway});
    }
  } else {
    std::error_code notNumeric;
    const auto address = asio::ip::make_address(_host, notNumeric);
    if (notNumeric) {
      _resolve();
    } else {
      _pingFirstReachable({address});
    }
  }
}

void LinuxPingTest::_armDeadline(std::chrono::nanoseconds duration) {
  _deadline.expires_after(duration);
  _deadline.async_wait([self = shared_from_this()](const std::error_code& cancelled) {
    if (!cancelled) self->_timeIsOver();
  });
}

void LinuxPingTest::_timeIsOver() {
  if (_queue == nullptr) return;
  if (!_run) {
    _fail("stopped before the name " + _host + " was resolved");
    return;
  }
  // The run may take a moment to end; it stays alive for that long, and we with it.
  _armDeadline(std::chrono::hours{1});
  const auto run = _run;
  run->stop();
}

void LinuxPingTest::_resolve() {
  _resolver.async_resolve(_host, "", [weak = weak_from_this()](const std::error_code& error, auto results) {
    const auto self = weak.lock();
    if (!self || self->_queue == nullptr) return;
    if (error) {
      self->_fail("unknown host " + self->_host + " (" + error.message() + ")");
      return;
    }
    std::vector<asio::ip::address> candidates;
    for (const auto& result : results) candidates.push_back(result.endpoint().address());
    self->_pingFirstReachable(candidates);
  });
}

void LinuxPingTest::_pingFirstReachable(const std::vector<asio::ip::address>& candidates) {
  std::error_code firstError;
  for (const auto& candidate : candidates) {
    const auto peer = withScope(candidate, _interface);
    const SourceProbe probe = probeSource(peer, _interface, _methods.binding);
    if (probe.error) {
      if (!firstError) firstError = probe.error;
      continue;
    }
    _openRun(peer, probe);
    return;
  }
  _fail("no way to " + _host + " over " + _interface + ": " + firstError.message());
}

void LinuxPingTest::_openRun(const asio::ip::address& peer, const SourceProbe& probe) {
  const auto onEnd = [weak = weak_from_this()] {
    if (const auto self = weak.lock()) self->_complete();
  };
  const std::pair<EchoSocketKind, bool> sockets[] = {{EchoSocketKind::datagram, _methods.datagramSocket},
                                                     {EchoSocketKind::raw, _methods.rawSocket}};
  std::string refusals;
  for (const auto& [kind, wanted] : sockets) {
    if (!wanted) continue;
    const char* const name = kind == EchoSocketKind::datagram ? "datagram socket" : "raw socket";
    std::error_code error;
    EchoSocket socket(kind, peer, _interface, _methods.binding, error);
    if (socket.isOpen()) {
      _log.log(kLogCategory, "Pinging " + _host + " over " + _interface + " through a " + name);
      _addHeading(peer, probe);
      _start(std::make_shared<EchoRun>(_context, std::move(socket), _report, onEnd));
      return;
    }
    refusals += std::string(name) + ": " + error.message() + "; ";
  }
  if (_methods.program.empty()) {
    _fail("no way of pinging is permitted: " + refusals + "no program");
    return;
  }
  _log.log(kLogCategory, "Pinging " + _host + " over " + _interface + " with the program " +
                             _methods.program + " (" + refusals + ")");
  _start(std::make_shared<ProgramRun>(
      _context, pingCommand(_methods.program, peer.to_string(), _interface, _duration), _report, onEnd));
}

void LinuxPingTest::_start(std::shared_ptr<PingRun> run) {
  _run = run;
  run->start();  // may end at once and let go of _run
}

void LinuxPingTest::_addHeading(const asio::ip::address& peer, const SourceProbe& probe) {
  _report->addLine(pingHeading(peer.is_v4() ? IpFamily::v4 : IpFamily::v6, _host, peer.to_string(),
                               probe.source.to_string(), _interface));
  if (!probe.byAddress) return;
  _report->addLine("(bound to the address " + probe.source.to_string() + " only: binding to " + _interface +
                   " itself is not permitted)");
}

void LinuxPingTest::_fail(std::string reason) {
  _report->fail(std::move(reason));
  _complete();
}

void LinuxPingTest::_complete() {
  WorkQueue* const queue = std::exchange(_queue, nullptr);
  if (queue == nullptr) return;
  _resolver.cancel();
  _deadline.cancel();
  _run.reset();
  queue->async([self = shared_from_this(), handler = std::exchange(_handler, nullptr)] {
    handler(self->_report->resultLine(), self->_report->anyAnswer());
  });
}

}  // namespace zal
