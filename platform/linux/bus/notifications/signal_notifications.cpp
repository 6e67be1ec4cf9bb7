#include "platform/linux/bus/notifications/signal_notifications.h"

#include <algorithm>
#include <utility>

#include "platform/linux/bus_module/bus_names.h"
#include "platform/linux/notifications/notification_file.h"

namespace zal {
namespace {

constexpr std::size_t kLongestMemberName = 255;

std::string ruleFor(const std::string& name) { return std::string(kSignalRule) + ",member='" + name + "'"; }

/// Empty for a signal without one, or with something that is none.
std::string idIn(sdbus::Message& signal) {
  std::string type;
  std::string contents;
  signal.peekType(type, contents);
  if (type != "s") return "";
  std::string id;
  signal >> id;
  return isPostId(id) ? id : "";
}

}  // namespace

void SignalNotifications::open(Handler onPost) {
  _onPost = std::move(onPost);
  _user = _connection.addUser(
      {.onConnected =
           [this](sdbus::IConnection& bus) {
             _object = sdbus::createObject(bus, kObjectPath);
             for (const std::string& name : _observed) _connection.listen(ruleFor(name));
           },
       .onLost = [this] { _object.reset(); },
       .signals = {{std::string(kSignalRule), [this](sdbus::Message& signal) { _hear(signal); }}}});
}

void SignalNotifications::observe(const std::string& name) {
  if (!isMemberName(name) || !_observed.insert(name).second) return;
  if (_object != nullptr) _connection.listen(ruleFor(name));
}

bool SignalNotifications::post(std::string_view name, std::string_view id) {
  if (_object == nullptr || !isMemberName(name)) return false;
  try {
    auto signal = _object->createSignal(kInterfaceName, std::string(name));
    signal << std::string(id);
    signal.send();
    return true;
  } catch (const sdbus::Error&) {
    return false;
  }
}

void SignalNotifications::_hear(sdbus::Message& signal) const {
  const std::string name = signal.getMemberName();
  if (_observed.contains(name)) _onPost(name, idIn(signal));
}

bool isMemberName(std::string_view name) {
  const auto isDigit = [](char c) { return c >= '0' && c <= '9'; };
  return !name.empty() && name.size() <= kLongestMemberName && !isDigit(name.front()) &&
         std::all_of(name.begin(), name.end(), [&](char c) {
           return isDigit(c) || (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_';
         });
}

}  // namespace zal
