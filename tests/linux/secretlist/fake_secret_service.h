#pragma once

#include <atomic>
#include <list>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include <systemd/sd-bus.h>

#include "platform/linux/secretlist/secret_item.h"

namespace zal::testing {

/// A secret service on a bus of the test's own, with the items it is given. It keeps the name of every
/// method that somebody calls.
class FakeSecretService {
 public:
  struct Item {
    std::string path;
    secretlist::SecretItem item;
  };
  FakeSecretService(const std::string& address, std::vector<Item> items);
  ~FakeSecretService();
  FakeSecretService(const FakeSecretService&) = delete;
  FakeSecretService& operator=(const FakeSecretService&) = delete;

  /// It owns its name and says nothing any more.
  void fallSilent();
  [[nodiscard]] std::vector<std::string> calls() const;

 private:
  static int _onMessage(sd_bus_message* message, void* self, sd_bus_error* error);
  static int _searchItems(sd_bus_message* message, void* self, sd_bus_error* error);
  static int _property(sd_bus* bus, const char* path, const char* interface, const char* property,
                       sd_bus_message* reply, void* item, sd_bus_error* error);
  void _run();

  static const sd_bus_vtable kServiceTable[];
  static const sd_bus_vtable kItemTable[];
  sd_bus* _bus = nullptr;
  std::vector<Item> _items;
  mutable std::mutex _mutex;
  std::vector<std::string> _calls;
  std::atomic<bool> _stop{false};
  std::thread _thread;
};

}  // namespace zal::testing
