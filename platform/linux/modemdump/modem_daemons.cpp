#include "platform/linux/modemdump/modem_daemons.h"

#include <algorithm>
#include <array>
#include <string_view>

#include "platform/linux/modemdump/message_json.h"
#include "platform/linux/modemdump/modem_manager.h"

namespace zal::modemdump {
namespace {

constexpr const char* kOfono = "org.ofono";
/// Of each modem of oFono; a modem has those that it can serve.
constexpr std::array<std::string_view, 6> kOfonoInterfaces = {
    "org.ofono.SimManager",    "org.ofono.NetworkRegistration", "org.ofono.ConnectionManager",
    "org.ofono.RadioSettings", "org.ofono.NetworkMonitor",      "org.ofono.MessageManager"};

/// An object of texts that are JSON already.
class JsonObject {
 public:
  void add(std::string_view key, std::string_view json) {
    while (json.ends_with('\n')) json.remove_suffix(1);
    _text += (_text.empty() ? "{\n" : ",\n") + jsonText(key) + ": " + std::string(json);
  }
  [[nodiscard]] std::string text() const { return _text.empty() ? "{}\n" : _text + "\n}\n"; }

 private:
  std::string _text;
};

/// The paths at the beginning of the objects in an answer of that form, which is read from its start.
std::vector<std::string> objectPaths(const BusMessage& answer, char container, const char* contents) {
  std::vector<std::string> paths;
  sd_bus_message* message = answer.get();
  if (sd_bus_message_enter_container(message, SD_BUS_TYPE_ARRAY, nullptr) > 0) {
    while (sd_bus_message_enter_container(message, container, contents) > 0) {
      const char* path = nullptr;
      if (sd_bus_message_read(message, "o", &path) <= 0) break;
      paths.emplace_back(path);
      if (sd_bus_message_skip(message, contents + 1) < 0 || sd_bus_message_exit_container(message) < 0) break;
    }
  }
  sd_bus_message_rewind(message, 1);
  return paths;
}

/// Nothing when it does not run or does not answer, which the files then know.
std::optional<BusMessage> askIfThere(SystemBus& bus, const std::string& name, const BusMethod& method,
                                     helper::DumpFiles& files) {
  const auto owned = bus.hasOwner(name);
  if (const auto* trouble = std::get_if<Trouble>(&owned)) {
    files.missing(name, trouble->text);
    return std::nullopt;
  }
  if (!std::get<bool>(owned)) {
    files.missing(name, "does not run");
    return std::nullopt;
  }
  auto answer = bus.call(method);
  if (auto* message = std::get_if<BusMessage>(&answer)) return std::move(*message);
  files.missing(name, std::get<Trouble>(answer).text);
  return std::nullopt;
}

std::string jsonOf(const SystemBus::Answer& answer) {
  if (const auto* trouble = std::get_if<Trouble>(&answer))
    return "{\"error\": " + jsonText(trouble->text) + "}";
  return messageJson(std::get<BusMessage>(answer).get()).value_or("{\"error\": \"not understood\"}");
}

bool isModem(const std::string& path) { return path.starts_with("/org/freedesktop/ModemManager1/Modem/"); }

ModemDaemon takeModemManager(const BusMessage& objects, helper::DumpFiles& files) {
  ModemDaemon daemon{ModemDaemon::Kind::modemManager,
                     objectPaths(objects, SD_BUS_TYPE_DICT_ENTRY, "oa{sa{sv}}")};
  std::erase_if(daemon.modems, [](const std::string& path) { return !isModem(path); });
  if (const auto json = messageJson(objects.get())) {
    files.write("state.json", *json,
                "ModemManager's objects, " + std::to_string(daemon.modems.size()) + " modems");
  } else {
    files.missing(kModemManager, "its answer is not understood");
  }
  return daemon;
}

ModemDaemon takeOfono(SystemBus& bus, const BusMessage& modems, helper::DumpFiles& files) {
  ModemDaemon daemon{ModemDaemon::Kind::ofono, objectPaths(modems, SD_BUS_TYPE_STRUCT, "oa{sv}")};
  JsonObject all;
  all.add("modems", messageJson(modems.get()).value_or("null"));
  for (const std::string& path : daemon.modems) {
    JsonObject interfaces;
    for (const std::string_view interface : kOfonoInterfaces)
      interfaces.add(interface, jsonOf(bus.call({kOfono, path, std::string(interface), "GetProperties"})));
    all.add(path, interfaces.text());
  }
  files.write("state.json", all.text(), "oFono's modems, " + std::to_string(daemon.modems.size()));
  return daemon;
}

}  // namespace

ModemDaemon writeModemState(SystemBus& bus, helper::DumpFiles& files) {
  if (const auto objects = askIfThere(
          bus, kModemManager,
          {kModemManager, kModemManagerPath, "org.freedesktop.DBus.ObjectManager", "GetManagedObjects"},
          files))
    return takeModemManager(*objects, files);
  if (const auto modems = askIfThere(bus, kOfono, {kOfono, "/", "org.ofono.Manager", "GetModems"}, files))
    return takeOfono(bus, *modems, files);
  return {};
}

void writeCells(SystemBus& bus, const ModemDaemon& daemon, helper::DumpFiles& files) {
  JsonObject cells;
  bool isEmpty = true;
  for (const std::string& path : daemon.modems) {
    const auto answer = bus.call({kModemManager, path, "org.freedesktop.ModemManager1.Modem", "GetCellInfo"});
    if (const auto* trouble = std::get_if<Trouble>(&answer)) {
      files.missing("cells of " + path, trouble->text);
      continue;
    }
    cells.add(path, jsonOf(answer));
    isEmpty = false;
  }
  if (!isEmpty) files.write("cells.json", cells.text());
}

}  // namespace zal::modemdump
