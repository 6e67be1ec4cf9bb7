#pragma once

#include <chrono>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <sdbus-c++/sdbus-c++.h>

namespace zal {

/// What keeps a daemon's answer away.
enum class BusTrouble {
  none,
  noOwner,     ///< nobody has the name
  refused,     ///< the daemon answered with an error of its own
  silent,      ///< it did not answer in time, or went while it was asked
  unreadable,  ///< the answer is of another type than agreed
};

template <class T>
struct BusAnswer {
  T value{};
  BusTrouble trouble = BusTrouble::none;
  explicit operator bool() const { return trouble == BusTrouble::none; }
};

struct BusMethod {
  std::string service;  ///< unique name, as ownerOf gives it
  std::string path;
  std::string interface;
  std::string name;
};

using BusProperties = std::map<std::string, sdbus::Variant>;

/// A dictionary of properties as some daemons answer it: plain, or once more inside a variant.
struct LooseDictionary {
  BusProperties values;
};
sdbus::Message& operator>>(sdbus::Message& message, LooseDictionary& dictionary);

/// The calls that one question costs, all asynchronous, on a connection that others share. Every
/// handler runs once on the main thread, perhaps inside ask(), unless the conversation ends before:
/// then nothing of it is left on the bus. Not to be ended inside a handler. Main thread only.
///
/// Daemons are asked under their unique names. A call to a well-known name can start its daemon when
/// that one went a moment ago; a call to a unique name never does.
///
///     bus.ownerOf("org.example.Daemon", [&](const BusAnswer<std::string>& owner) {
///       if (owner) bus.ask<bool>({owner.value, "/", "org.example", "IsOn"}, [](const auto& answer) {});
///     });
class BusConversation {
 public:
  /// `limit` is each call's own.
  BusConversation(sdbus::IConnection& bus, std::chrono::milliseconds limit) : _bus(bus), _limit(limit) {}
  ~BusConversation();
  BusConversation(const BusConversation&) = delete;
  BusConversation& operator=(const BusConversation&) = delete;

  /// Whether the bus is there still, as far as its library has noticed.
  [[nodiscard]] bool isConnected() const;
  /// The unique name of who has the name now.
  void ownerOf(const std::string& name, std::function<void(const BusAnswer<std::string>&)> handler);
  void allProperties(const std::string& service, const std::string& path, const std::string& interface,
                     std::function<void(const BusAnswer<BusProperties>&)> handler);

  template <class T>
  void property(const std::string& service, const std::string& path, const std::string& interface,
                const std::string& name, std::function<void(const BusAnswer<T>&)> handler) {
    ask<sdbus::Variant>(
        {service, path, kPropertiesInterface, "Get"},
        [handler = std::move(handler)](const BusAnswer<sdbus::Variant>& found) {
          if (found && !found.value.containsValueOfType<T>())
            return handler({.trouble = BusTrouble::unreadable});
          handler(found ? BusAnswer<T>{.value = found.value.get<T>()}
                        : BusAnswer<T>{.trouble = found.trouble});
        },
        interface, name);
  }
  /// T is the one value that the method returns.
  template <class T, class... Arguments>
  void ask(const BusMethod& method, std::function<void(const BusAnswer<T>&)> handler,
           const Arguments&... arguments) {
    const auto shared = std::make_shared<std::function<void(const BusAnswer<T>&)>>(std::move(handler));
    try {
      _proxies.push_back(sdbus::createProxy(_bus, method.service, method.path));
      auto call = _proxies.back()->createMethodCall(method.interface, method.name);
      (static_cast<void>(call << arguments), ...);
      _proxies.back()->callMethod(
          call,
          [shared](sdbus::MethodReply& reply, const sdbus::Error* error) {
            (*shared)(_read<T>(reply, error));
          },
          _limit);
    } catch (const sdbus::Error& error) {
      (*shared)({.trouble = _troubleOf(error)});
    }
  }

 private:
  static constexpr const char* kPropertiesInterface = "org.freedesktop.DBus.Properties";

  template <class T>
  [[nodiscard]] static BusAnswer<T> _read(sdbus::MethodReply& reply, const sdbus::Error* error) {
    if (error != nullptr) return {.trouble = _troubleOf(*error)};
    try {
      BusAnswer<T> answer;
      reply >> answer.value;
      return answer;
    } catch (const sdbus::Error&) {
      return {.trouble = BusTrouble::unreadable};
    }
  }
  [[nodiscard]] static BusTrouble _troubleOf(const sdbus::Error& error);

  sdbus::IConnection& _bus;
  const std::chrono::milliseconds _limit;
  std::vector<std::unique_ptr<sdbus::IProxy>> _proxies;
};

/// The property's value; nothing when it is not among them, or of another type, which `trouble` tells.
template <class T>
[[nodiscard]] std::optional<T> propertyOf(const BusProperties& properties, const std::string& name,
                                          BusTrouble& trouble) {
  const auto found = properties.find(name);
  if (found == properties.end()) return std::nullopt;
  if (found->second.template containsValueOfType<T>()) return found->second.template get<T>();
  trouble = BusTrouble::unreadable;
  return std::nullopt;
}

}  // namespace zal
