#include "platform/linux/bus/bus_conversation.h"

namespace zal {

sdbus::Message& operator>>(sdbus::Message& message, LooseDictionary& dictionary) {
  std::string type;
  std::string contents;
  message.peekType(type, contents);
  if (type != "v") return message >> dictionary.values;
  sdbus::Variant inner;
  message >> inner;
  dictionary.values = inner.get<BusProperties>();
  return message;
}

BusConversation::~BusConversation() = default;

bool BusConversation::isConnected() const {
  try {
    return !_bus.getUniqueName().empty();
  } catch (const sdbus::Error&) {
    return false;
  }
}

void BusConversation::ownerOf(const std::string& name,
                              std::function<void(const BusAnswer<std::string>&)> handler) {
  constexpr const char* kBus = "org.freedesktop.DBus";
  ask<std::string>({kBus, "/org/freedesktop/DBus", kBus, "GetNameOwner"}, std::move(handler), name);
}

void BusConversation::allProperties(const std::string& service, const std::string& path,
                                    const std::string& interface,
                                    std::function<void(const BusAnswer<BusProperties>&)> handler) {
  ask<BusProperties>({service, path, kPropertiesInterface, "GetAll"}, std::move(handler), interface);
}

BusTrouble BusConversation::_troubleOf(const sdbus::Error& error) {
  const std::string prefix = "org.freedesktop.DBus.Error.";
  const std::string& name = error.getName();
  if (name == prefix + "NameHasNoOwner" || name == prefix + "ServiceUnknown") return BusTrouble::noOwner;
  for (const char* slow : {"NoReply", "Timeout", "TimedOut", "Disconnected"}) {
    if (name == prefix + slow) return BusTrouble::silent;
  }
  return name.starts_with("System.Error.") ? BusTrouble::silent : BusTrouble::refused;
}

}  // namespace zal
