#include "platform/linux/bus_module/bus_module.h"

#include <dlfcn.h>

#include "platform/linux/bus_module/bus_addresses.h"

namespace zal {

// The code stays loaded: tasks in flight may still be in it.
BusModule::~BusModule() = default;

BusServices* BusModule::services() {
  const std::lock_guard lock(_mutex);
  if (_services == nullptr && !_failed && (mayBeThere(_host.systemBus) || mayBeThere(_host.sessionBus))) {
    _services = _load();
    _failed = _services == nullptr;
  }
  return _services.get();
}

std::unique_ptr<BusServices> BusModule::_load() {
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
