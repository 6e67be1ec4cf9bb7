#include "platform/linux/ping/ping_attempt.h"

#include <net/if.h>

#include <system_error>
#include <utility>

#include "platform/agent_log.h"
#include "platform/linux/ping/echo_run.h"
#include "platform/linux/ping/interface_binding.h"
#include "platform/linux/ping/ping_text.h"
#include "platform/linux/ping/program_run.h"
#include "platform/linux/ping/route_table.h"

namespace zal {
namespace {

constexpr std::string_view kLogCategory = "Ping";

/// A link-local address means nothing without the link.
asio::ip::address withScope(const asio::ip::address& address, const std::string& interface) {
  if (!address.is_v6() || !address.to_v6().is_link_local() || address.to_v6().scope_id() != 0) return address;
  asio::ip::address_v6 scoped = address.to_v6();
  scoped.scope_id(::if_nametoindex(interface.c_str()));
  return scoped;
}

}  // namespace

PingAttempt::PingAttempt(asio::io_context& context, AgentLog& log, PingTask task)
    : _context(context), _log(log), _task(std::move(task)), _resolver(context), _deadline(context) {}

void PingAttempt::begin() {
  _armDeadline(_task.duration);
  if (::if_nametoindex(_task.interface.c_str()) == 0) {
    _fail("there is no interface " + _task.interface);
  } else if (_task.host == kDefaultGatewayAddress) {
    const auto route = currentDefaultRoute(_task.interface);
    if (!route) {
      _fail("no route to a gateway: " + _task.interface + " has no default route");
    } else if (!route->gateway) {
      _fail("no gateway to ping: the default route of " + _task.interface + " is a point-to-point link");
    } else {
      _pingFirstReachable({*route->gateway});
    }
  } else {
    std::error_code notNumeric;
    const auto address = asio::ip::make_address(_task.host, notNumeric);
    if (notNumeric) {
      _resolve();
    } else {
      _pingFirstReachable({address});
    }
  }
}

void PingAttempt::_armDeadline(std::chrono::nanoseconds duration) {
  _deadline.expires_after(duration);
  _deadline.async_wait([self = shared_from_this()](const std::error_code& cancelled) {
    if (!cancelled) self->end();
  });
}

void PingAttempt::end() {
  if (_task.queue == nullptr) return;
  if (!_run) {
    _fail("stopped before the name " + _task.host + " was resolved");
    return;
  }
  // The run may take a moment to end; it stays alive for that long, and we with it.
  _armDeadline(std::chrono::hours{1});
  const auto run = _run;
  run->stop();
}

void PingAttempt::_resolve() {
  const auto onResolved = [weak = weak_from_this()](const std::error_code& error, const auto& results) {
    const auto self = weak.lock();
    if (!self || self->_task.queue == nullptr) return;
    if (error) {
      self->_fail("unknown host " + self->_task.host + " (" + error.message() + ")");
      return;
    }
    std::vector<asio::ip::address> candidates;
    for (const auto& result : results) candidates.push_back(result.endpoint().address());
    self->_pingFirstReachable(candidates);
  };
  _resolver.async_resolve(_task.host, "", onResolved);
}

void PingAttempt::_pingFirstReachable(const std::vector<asio::ip::address>& candidates) {
  std::error_code firstError;
  for (const auto& candidate : candidates) {
    const auto peer = withScope(candidate, _task.interface);
    const SourceProbe probe = probeSource(peer, _task.interface, _task.methods.binding);
    if (probe.error) {
      if (!firstError) firstError = probe.error;
      continue;
    }
    _openRun(peer, probe);
    return;
  }
  _fail("no way to " + _task.host + " over " + _task.interface + ": " + firstError.message());
}

void PingAttempt::_openRun(const asio::ip::address& peer, const SourceProbe& probe) {
  const auto onEnd = [weak = weak_from_this()] {
    if (const auto self = weak.lock()) self->_complete();
  };
  const std::pair<EchoSocketKind, bool> sockets[] = {{EchoSocketKind::datagram, _task.methods.datagramSocket},
                                                     {EchoSocketKind::raw, _task.methods.rawSocket}};
  std::string refusals;
  for (const auto& [kind, wanted] : sockets) {
    if (!wanted) continue;
    const char* const name = kind == EchoSocketKind::datagram ? "datagram socket" : "raw socket";
    std::error_code error;
    EchoSocket socket(kind, peer, _task.interface, _task.methods.binding, error);
    if (socket.isOpen()) {
      _log.log(kLogCategory, "Pinging " + _task.host + " over " + _task.interface + " through a " + name);
      _addHeading(peer, probe);
      _start(std::make_shared<EchoRun>(_context, std::move(socket), _task.duration, _task.report, onEnd));
      return;
    }
    refusals += std::string(name) + ": " + error.message() + "; ";
  }
  if (_task.methods.program.empty()) {
    _fail("no way of pinging is permitted: " + refusals + "no program");
    return;
  }
  _log.log(kLogCategory, "Pinging " + _task.host + " over " + _task.interface + " with the program " +
                             _task.methods.program + " (" + refusals + ")");
  _start(std::make_shared<ProgramRun>(
      _context, pingCommand(_task.methods.program, peer.to_string(), _task.interface, _task.duration),
      _task.report, onEnd));
}

void PingAttempt::_start(const std::shared_ptr<PingRun>& run) {
  _run = run;
  run->start();  // may end at once and let go of _run
}

void PingAttempt::_addHeading(const asio::ip::address& peer, const SourceProbe& probe) {
  _task.report->addLine(pingHeading(peer.is_v4() ? IpFamily::v4 : IpFamily::v6, _task.host, peer.to_string(),
                                    probe.source.to_string(), _task.interface));
  if (!probe.byAddress) return;
  _task.report->addLine("(bound to the address " + probe.source.to_string() + " only: binding to " +
                        _task.interface + " itself is not permitted)");
}

void PingAttempt::_fail(std::string reason) {
  _task.report->fail(std::move(reason));
  _complete();
}

void PingAttempt::_complete() {
  WorkQueue* const queue = std::exchange(_task.queue, nullptr);
  if (queue == nullptr) return;
  _resolver.cancel();
  _deadline.cancel();
  _run.reset();
  // The job takes the report alone: what belongs to the loop must not outlive it on a queue.
  queue->async([report = _task.report, handler = std::exchange(_task.handler, nullptr)] {
    handler(report->resultLine(), report->anyAnswer());
  });
}

}  // namespace zal
