#include "platform/linux/ping/linux_ping_facility.h"

#include <utility>

#include "platform/linux/ping/linux_ping_test.h"

namespace zal {

LinuxPingFacility::LinuxPingFacility(asio::io_context& context, Interfaces interfaces, AgentLog& log,
                                     PingMethods methods, RootedPaths paths)
    : _context(context),
      _interfaces(std::move(interfaces)),
      _log(log),
      _methods(std::move(methods)),
      _paths(std::move(paths)) {}

std::shared_ptr<PingTest> LinuxPingFacility::makeTest(std::string address, bool useWifi) {
  return std::make_shared<LinuxPingTest>(_context, _log, std::move(address),
                                         useWifi ? _interfaces.wifi : _interfaces.cellular, _methods, _paths);
}

}  // namespace zal
