#include "platform/linux/bus_module/ipc_with_bus.h"

#include <utility>

namespace zal {
namespace {

class ListenerWithBus : public IpcListener {
 public:
  ListenerWithBus(std::unique_ptr<IpcListener> socket, BusModule& bus)
      : _socket(std::move(socket)), _bus(bus) {}

  void resume(ErrorHandler onInvalid, PeerHandler onPeerEvent) override {
    _socket->resume(std::move(onInvalid), onPeerEvent);
    _handler = std::make_shared<PeerHandler>(std::move(onPeerEvent));
    _bus.whenLoaded([handler = std::weak_ptr(_handler)](BusServices& services) {
      services.door().open([handler](const auto& peer, const auto& event) {
        if (const auto delivers = handler.lock()) (*delivers)(peer, event);
      });
    });
    _bus.loadSoon();
  }

 private:
  std::unique_ptr<IpcListener> _socket;
  BusModule& _bus;
  std::shared_ptr<PeerHandler> _handler;  // nothing is delivered after the listener's end
};

}  // namespace

std::unique_ptr<IpcListener> IpcWithBus::makeListener(std::string serviceName) {
  return std::make_unique<ListenerWithBus>(_socket.makeListener(std::move(serviceName)), _bus);
}

}  // namespace zal
