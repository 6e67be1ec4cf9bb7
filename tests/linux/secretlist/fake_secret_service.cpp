#include "tests/linux/secretlist/fake_secret_service.h"

#include <stdexcept>

namespace zal::testing {
namespace {

void require(int result, const char* what) {
  if (result < 0) throw std::runtime_error(std::string("fake secret service: ") + what);
}

}  // namespace

const sd_bus_vtable FakeSecretService::kServiceTable[] = {
    SD_BUS_VTABLE_START(0),
    SD_BUS_METHOD("SearchItems", "a{ss}", "aoao", &FakeSecretService::_searchItems,
                  SD_BUS_VTABLE_UNPRIVILEGED),
    SD_BUS_VTABLE_END,
};

const sd_bus_vtable FakeSecretService::kItemTable[] = {
    SD_BUS_VTABLE_START(0),
    SD_BUS_PROPERTY("Attributes", "a{ss}", &FakeSecretService::_property, 0, 0),
    SD_BUS_PROPERTY("Created", "t", &FakeSecretService::_property, 0, 0),
    SD_BUS_PROPERTY("Label", "s", &FakeSecretService::_property, 0, 0),
    SD_BUS_PROPERTY("Locked", "b", &FakeSecretService::_property, 0, 0),
    SD_BUS_PROPERTY("Modified", "t", &FakeSecretService::_property, 0, 0),
    SD_BUS_VTABLE_END,
};

FakeSecretService::FakeSecretService(const std::string& address, std::vector<Item> items)
    : _items(std::move(items)) {
  require(sd_bus_new(&_bus), "bus");
  require(sd_bus_set_address(_bus, address.c_str()), "address");
  require(sd_bus_set_bus_client(_bus, 1), "client");
  require(sd_bus_start(_bus), "start");
  require(sd_bus_add_filter(_bus, nullptr, &FakeSecretService::_onMessage, this), "filter");
  require(sd_bus_add_object_vtable(_bus, nullptr, "/org/freedesktop/secrets",
                                   "org.freedesktop.Secret.Service", kServiceTable, this),
          "service");
  for (Item& item : _items) {
    require(sd_bus_add_object_vtable(_bus, nullptr, item.path.c_str(), "org.freedesktop.Secret.Item",
                                     kItemTable, &item.item),
            "item");
  }
  require(sd_bus_request_name(_bus, "org.freedesktop.secrets", 0), "name");
  _thread = std::thread([this] { _run(); });
}

FakeSecretService::~FakeSecretService() {
  fallSilent();
  sd_bus_flush_close_unref(_bus);
}

void FakeSecretService::fallSilent() {
  _stop = true;
  if (_thread.joinable()) _thread.join();
}

std::vector<std::string> FakeSecretService::calls() const {
  const std::lock_guard lock(_mutex);
  return _calls;
}

void FakeSecretService::_run() {
  while (!_stop) {
    if (sd_bus_process(_bus, nullptr) == 0) (void)sd_bus_wait(_bus, 10'000);
  }
}

int FakeSecretService::_onMessage(sd_bus_message* message, void* self, sd_bus_error* /*error*/) {
  auto& service = *static_cast<FakeSecretService*>(self);
  if (sd_bus_message_is_method_call(message, nullptr, nullptr) > 0) {
    const std::lock_guard lock(service._mutex);
    service._calls.emplace_back(sd_bus_message_get_member(message));
  }
  return 0;
}

int FakeSecretService::_searchItems(sd_bus_message* message, void* self, sd_bus_error* /*error*/) {
  const auto& service = *static_cast<FakeSecretService*>(self);
  sd_bus_message* reply = nullptr;
  require(sd_bus_message_new_method_return(message, &reply), "reply");
  for (const bool locked : {false, true}) {
    require(sd_bus_message_open_container(reply, 'a', "o"), "reply");
    for (const Item& item : service._items) {
      if (item.item.isLocked == locked)
        require(sd_bus_message_append(reply, "o", item.path.c_str()), "reply");
    }
    require(sd_bus_message_close_container(reply), "reply");
  }
  const int result = sd_bus_send(nullptr, reply, nullptr);
  sd_bus_message_unref(reply);
  return result;
}

int FakeSecretService::_property(sd_bus* /*bus*/, const char* /*path*/, const char* /*interface*/,
                                 const char* property, sd_bus_message* reply, void* item,
                                 sd_bus_error* /*error*/) {
  const auto& it = *static_cast<secretlist::SecretItem*>(item);
  const std::string name = property;
  if (name == "Label") return sd_bus_message_append(reply, "s", it.label.c_str());
  if (name == "Locked") return sd_bus_message_append(reply, "b", it.isLocked ? 1 : 0);
  if (name != "Attributes") {
    const auto seconds = std::chrono::floor<std::chrono::seconds>(it.created.time_since_epoch());
    return sd_bus_message_append(reply, "t", static_cast<std::uint64_t>(seconds.count()));
  }
  require(sd_bus_message_open_container(reply, 'a', "{ss}"), "attributes");
  for (const auto& [key, value] : it.attributes)
    require(sd_bus_message_append(reply, "{ss}", key.c_str(), value.c_str()), "attributes");
  return sd_bus_message_close_container(reply);
}

}  // namespace zal::testing
