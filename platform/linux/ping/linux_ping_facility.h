#pragma once

#include <memory>
#include <string>

#include "platform/configuration.h"
#include "platform/linux/files/rooted_paths.h"
#include "platform/linux/ping/echo_socket.h"
#include "platform/ping_test.h"

namespace asio {
class io_context;
}

namespace zal {

class AgentLog;

/// The ways of pinging that are tried, in this order. A test leaves some out to reach the others.
struct PingMethods {
  bool datagramSocket = true;
  bool rawSocket = true;
  std::string program = "ping";  ///< looked for in PATH; empty: none
  BindingChoice binding = BindingChoice::deviceFirst;
};

/// Pings by ICMP echo over the configured interfaces. The tests do their work on the loop and
/// nowhere else; names are resolved by one thread of Asio's. Any thread may call. The loop runs on
/// one thread; loop, log and facility outlive the tests' use of them. A test that runs when the loop
/// goes does not complete any more.
class LinuxPingFacility : public PingFacility {
 public:
  /// Loop and log are borrowed.
  LinuxPingFacility(asio::io_context& context, Interfaces interfaces, AgentLog& log, PingMethods methods = {},
                    RootedPaths paths = {});
  [[nodiscard]] std::shared_ptr<PingTest> makeTest(std::string address, bool useWifi) override;

 private:
  asio::io_context& _context;
  const Interfaces _interfaces;
  AgentLog& _log;
  const PingMethods _methods;
  const RootedPaths _paths;  // of the results
};

}  // namespace zal
