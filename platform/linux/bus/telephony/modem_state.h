#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/telephony.h"
#include "platform/value.h"

namespace zal {

inline constexpr const char* kModemManager = "org.freedesktop.ModemManager1";
inline constexpr const char* kModemManagerPath = "/org/freedesktop/ModemManager1";
inline constexpr const char* kModem = "org.freedesktop.ModemManager1.Modem";
inline constexpr const char* kModem3gpp = "org.freedesktop.ModemManager1.Modem.Modem3gpp";
inline constexpr const char* kModemSignal = "org.freedesktop.ModemManager1.Modem.Signal";
inline constexpr const char* kModemLocation = "org.freedesktop.ModemManager1.Modem.Location";
inline constexpr const char* kModemFirmware = "org.freedesktop.ModemManager1.Modem.Firmware";
inline constexpr const char* kSim = "org.freedesktop.ModemManager1.Sim";
inline constexpr const char* kBearer = "org.freedesktop.ModemManager1.Bearer";

/// One modem as ModemManager, and NetworkManager above it, describe it at one moment. What could not be
/// read, or is not of its type, counts as not there, and fails only those questions that need it.
struct ModemState {
  std::string path;                              ///< empty: there is no modem
  ValueMap interfaces;                           ///< properties by the modem's interfaces
  std::optional<ValueMap> sim;                   ///< properties of the card; nothing: none, or not read
  std::vector<std::optional<ValueMap>> bearers;  ///< properties of each, in the modem's order
  bool hasNetworkManager = false;                ///< it is on the bus
  std::optional<ValueMap> networkManager;        ///< its properties, when it gave them

  /// Nothing when the interface or the property is not there or of another type.
  template <class Type>
  [[nodiscard]] const Type* property(std::string_view interface, std::string_view name) const {
    const Value* const value = _property(interface, name);
    return value != nullptr ? value->as<Type>() : nullptr;
  }
  /// The modem says that no card is in it.
  [[nodiscard]] bool isWithoutSim() const;
  [[nodiscard]] std::vector<std::string> bearerPaths() const;

 private:
  [[nodiscard]] const Value* _property(std::string_view interface, std::string_view name) const;
};

/// Nothing when the property is not there or of another type.
template <class Type>
[[nodiscard]] const Type* propertyOf(const ValueMap& properties, std::string_view name) {
  const auto found = properties.find(name);
  return found != properties.end() ? found->second.as<Type>() : nullptr;
}

/// The modem in use among ModemManager's objects, with its interfaces alone: the first that is
/// registered, else the first that is enabled, else the first; in the order of their paths, counted by
/// the number at the end.
[[nodiscard]] ModemState modemInUse(const ValueMap& managedObjects);

/// Nothing when the modem tells no strength.
[[nodiscard]] std::optional<CellularSignal> modemSignal(const ModemState& state);

}  // namespace zal
