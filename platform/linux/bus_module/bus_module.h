#pragma once

#include <memory>
#include <mutex>
#include <string>

#include "platform/linux/bus_module/bus_host.h"
#include "platform/linux/bus_module/bus_services.h"

namespace zal {

/// The module with everything that speaks D-Bus, a shared object of our own beside the agent. It is
/// loaded when a bus is first seen: an agent on a host without one has neither its memory nor its
/// start time, and one with a bus listens before it loads anything. Any thread.
class BusModule {
 public:
  /// `path` is the shared object's.
  BusModule(const BusHost& host, std::string path) : _host(host), _path(std::move(path)) {}
  ~BusModule();
  BusModule(const BusModule&) = delete;
  BusModule& operator=(const BusModule&) = delete;

  /// Nothing while the host has no bus, or when the module cannot be had, which is said once.
  [[nodiscard]] BusServices* services();

 private:
  [[nodiscard]] std::unique_ptr<BusServices> _load();

  const BusHost& _host;
  const std::string _path;
  std::mutex _mutex;
  bool _failed = false;
  std::unique_ptr<BusServices> _services;
};

}  // namespace zal
