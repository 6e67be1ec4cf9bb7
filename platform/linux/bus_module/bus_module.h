#pragma once

#include <atomic>
#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "platform/linux/bus_module/bus_host.h"
#include "platform/linux/bus_module/bus_services.h"

namespace zal {

/// The module with everything that speaks D-Bus, a shared object of our own beside the agent. It is
/// loaded when a bus is first seen: an agent on a host without one, or with `[bus] enabled = false`,
/// has neither its memory nor its start time, and one with a bus listens before it loads anything.
/// Made and ended on the main thread, which makes the services.
class BusModule {
 public:
  /// `path` is the shared object's.
  BusModule(const BusHost& host, std::string path);
  ~BusModule();
  BusModule(const BusModule&) = delete;
  BusModule& operator=(const BusModule&) = delete;

  /// Nothing while the host has no bus, or when the module cannot be had, which is said once. Any
  /// thread; a queue thread that is the first waits up to a second for the main thread to make them.
  [[nodiscard]] BusServices* services();
  /// Nothing while nobody had a use for them: loads nothing. Any thread.
  [[nodiscard]] BusServices* loaded() const { return _made; }

  // Main thread only.

  /// Runs the handler once the services are made: at once if they are. It outlives them.
  void whenLoaded(std::function<void(BusServices&)> handler);
  /// Has the services made where there is a bus; the reading of the module is done on a queue thread.
  void loadSoon();

 private:
  [[nodiscard]] bool _mayLoad() const;
  void _make();
  void _awaitMain();
  [[nodiscard]] std::unique_ptr<BusServices> _load() const;

  const BusHost& _host;
  const std::string _path;
  const std::thread::id _mainThread = std::this_thread::get_id();
  std::vector<std::function<void(BusServices&)>> _handlers;
  std::unique_ptr<BusServices> _services;
  std::atomic<BusServices*> _made = nullptr;
  std::atomic<bool> _failed = false;
  std::mutex _mutex;
  std::condition_variable _decided;                             // made or failed
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards tasks in flight
};

}  // namespace zal
