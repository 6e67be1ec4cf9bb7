#pragma once

#include <memory>
#include <string>
#include <variant>
#include <vector>

#include <systemd/sd-bus.h>

#include "platform/linux/secretlist/secret_item.h"

namespace zal::secretlist {

/// Why something could not be had, in half a sentence.
struct Trouble {
  std::string text;
};

/// The session's secret service (org.freedesktop.secrets), if one runs: nothing here starts one, and
/// nothing here asks for a secret. Each call waits up to two seconds; one thread.
class SecretService {
 public:
  [[nodiscard]] static std::variant<SecretService, Trouble> connect();
  /// The paths of all items, those of locked collections too.
  [[nodiscard]] std::variant<std::vector<std::string>, Trouble> items();
  [[nodiscard]] std::variant<SecretItem, Trouble> item(const std::string& path);

 private:
  struct Close {
    void operator()(sd_bus* bus) const { sd_bus_close_unref(bus); }
  };
  using Bus = std::unique_ptr<sd_bus, Close>;

  explicit SecretService(Bus bus) : _bus(std::move(bus)) {}
  Bus _bus;
};

}  // namespace zal::secretlist
