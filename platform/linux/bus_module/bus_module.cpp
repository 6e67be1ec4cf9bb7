#include "platform/linux/bus_module/bus_module.h"

#include <dlfcn.h>

#include <chrono>
#include <utility>

#include "platform/linux/bus_module/bus_addresses.h"

namespace zal {
namespace {

/// The main thread makes the services in milliseconds; one that is busy for longer has no use for us.
constexpr std::chrono::seconds kMakingLimit{1};

}  // namespace

BusModule::BusModule(const BusHost& host, std::string path) : _host(host), _path(std::move(path)) {}

// The code stays loaded: tasks in flight may still be in it.
BusModule::~BusModule() = default;

BusServices* BusModule::services() {
  if (_made == nullptr && !_failed && _mayLoad()) {
    std::this_thread::get_id() == _mainThread ? _make() : _awaitMain();
  }
  return _made;
}

void BusModule::whenLoaded(std::function<void(BusServices&)> handler) {
  _handlers.push_back(std::move(handler));
  if (_services != nullptr) _handlers.back()(*_services);
}

void BusModule::loadSoon() {
  if (_made != nullptr || _failed || !_mayLoad()) return;
  _host.queues.global(QueuePriority::standard)
      .async([this, path = _path, &loop = _host.mainLoop, alive = std::weak_ptr<bool>(_alive)] {
        // For what it costs to read; whether it is there is found when it is used.
        ::dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
        loop.post([this, alive] {
          if (!alive.expired()) static_cast<void>(services());
        });
      });
}

bool BusModule::_mayLoad() const {
  return _host.configuration.bus.enabled && (mayBeThere(_host.systemBus) || mayBeThere(_host.sessionBus));
}

void BusModule::_make() {
  _services = _load();
  {
    const std::lock_guard lock(_mutex);
    _failed = _services == nullptr;
    _made = _services.get();
  }
  _decided.notify_all();
  if (_services == nullptr) return;
  for (std::size_t i = 0; i < _handlers.size(); ++i) _handlers[i](*_services);
}

void BusModule::_awaitMain() {
  _host.mainLoop.post([this, alive = std::weak_ptr<bool>(_alive)] {
    if (!alive.expired()) static_cast<void>(services());
  });
  std::unique_lock lock(_mutex);
  _decided.wait_for(lock, kMakingLimit, [this] { return _made != nullptr || _failed; });
}

std::unique_ptr<BusServices> BusModule::_load() const {
  void* const library = ::dlopen(_path.c_str(), RTLD_NOW | RTLD_LOCAL);
  void* const symbol = library != nullptr ? ::dlsym(library, kMakeBusServices) : nullptr;
  if (symbol == nullptr) {
    const char* const reason = ::dlerror();
    _host.log.warning("Without the services of the bus: " + std::string(reason != nullptr ? reason : _path));
    return nullptr;
  }
  return std::unique_ptr<BusServices>(reinterpret_cast<MakeBusServices*>(symbol)(_host));
}

}  // namespace zal
