#pragma once

#include <memory>
#include <string>

#include "platform/ipc_listener.h"
#include "platform/linux/bus_module/bus_module.h"

namespace zal {

/// The socket's service, and the bus's door beside it for the same handler: whoever comes by either is a
/// peer like any other. The socket listens before the module is so much as looked for, and goes on
/// alone where there is no bus. Main thread only.
class IpcWithBus : public IpcService {
 public:
  IpcWithBus(IpcService& socket, BusModule& bus) : _socket(socket), _bus(bus) {}
  [[nodiscard]] std::unique_ptr<IpcListener> makeListener(std::string serviceName) override;

 private:
  IpcService& _socket;
  BusModule& _bus;
};

}  // namespace zal
