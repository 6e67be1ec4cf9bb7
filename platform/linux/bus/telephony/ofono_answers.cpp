#include "platform/linux/bus/telephony/ofono_answers.h"

#include <array>
#include <cstdint>
#include <utility>

#include "platform/linux/bus/telephony/cellular_strength.h"

namespace zal {
namespace {

using Answer = std::optional<CellularAnswer>;

/// Thrown where a property has another type than documented, or is not there and must be.
struct Unanswered {};

template <typename Type>
std::optional<Type> property(const OfonoProperties& properties, const char* name) {
  const auto found = properties.find(name);
  if (found == properties.end()) return std::nullopt;
  if (!found->second.containsValueOfType<Type>()) throw Unanswered{};
  return found->second.get<Type>();
}

template <typename Type>
Type needed(const OfonoProperties& properties, const char* name) {
  const auto value = property<Type>(properties, name);
  if (!value) throw Unanswered{};
  return *value;
}

const OfonoProperties& needed(const OfonoInterfaces& interfaces, const char* name) {
  const OfonoProperties* const properties = interfaces(name);
  if (properties == nullptr) throw Unanswered{};
  return *properties;
}

/// Empty where it is left out.
std::string text(const OfonoProperties& properties, const char* name) {
  return property<std::string>(properties, name).value_or("");
}

Value textOrNull(std::string words) { return words.empty() ? Value() : Value(std::move(words)); }

constexpr const char* kModem = "Modem";
constexpr const char* kNetwork = "NetworkRegistration";
constexpr const char* kSim = "SimManager";
constexpr const char* kData = "ConnectionManager";
constexpr const char* kRadio = "RadioSettings";

enum class Kind {
  text,
  yesOrNo,
  yesOrLeftOut,  ///< left out where the question does not arise
  number,
};

struct PropertyRow {
  CellularQuery query;
  const char* interface;
  const char* property;
  Kind kind;
};
constexpr std::array kPropertyRows = {
    PropertyRow{CellularQuery::operatorName, kNetwork, "Name", Kind::text},
    PropertyRow{CellularQuery::providerName, kSim, "ServiceProviderName", Kind::text},
    PropertyRow{CellularQuery::allowedMode, kRadio, "TechnologyPreference", Kind::text},
    PropertyRow{CellularQuery::firmwareVersion, kModem, "Revision", Kind::text},
    PropertyRow{CellularQuery::mobileIdentity, kModem, "Serial", Kind::text},
    PropertyRow{CellularQuery::simIdentity, kSim, "CardIdentifier", Kind::text},
    PropertyRow{CellularQuery::subscriberIdentity, kSim, "SubscriberIdentity", Kind::text},
    PropertyRow{CellularQuery::subscriberCountryCode, kSim, "MobileCountryCode", Kind::text},
    PropertyRow{CellularQuery::registrationStatus, kNetwork, "Status", Kind::text},
    PropertyRow{CellularQuery::radioAccessTechnology, kNetwork, "Technology", Kind::text},
    PropertyRow{CellularQuery::serviceCenterAddress, "MessageManager", "ServiceCenterAddress", Kind::text},
    PropertyRow{CellularQuery::ttyMode, "TextTelephony", "Enabled", Kind::yesOrNo},
    PropertyRow{CellularQuery::isDataAttached, kData, "Attached", Kind::yesOrNo},
    PropertyRow{CellularQuery::isDataEnabled, kData, "Powered", Kind::yesOrNo},
    PropertyRow{CellularQuery::isDataDisallowed, kData, "Suspended", Kind::yesOrLeftOut},
    PropertyRow{CellularQuery::internationalDataAccess, kData, "RoamingAllowed", Kind::yesOrNo},
    PropertyRow{CellularQuery::servingCellId, kNetwork, "CellId", Kind::number},
    PropertyRow{CellularQuery::lastKnownSubscriberCountryCode, kSim, "MobileCountryCode", Kind::text},
    PropertyRow{CellularQuery::subscriberNetworkCode, kSim, "MobileNetworkCode", Kind::text},
    PropertyRow{CellularQuery::currentNetworkCountryCode, kNetwork, "MobileCountryCode", Kind::text},
    PropertyRow{CellularQuery::currentNetworkCode, kNetwork, "MobileNetworkCode", Kind::text},
};

Value valueOf(const PropertyRow& row, const OfonoProperties& properties) {
  switch (row.kind) {
    case Kind::text:
      return textOrNull(text(properties, row.property));
    case Kind::yesOrNo:
      return needed<bool>(properties, row.property);
    case Kind::yesOrLeftOut: {
      const auto yes = property<bool>(properties, row.property);
      return yes ? Value(*yes) : Value();
    }
    case Kind::number:
      return std::int64_t{needed<std::uint32_t>(properties, row.property)};
  }
  throw Unanswered{};
}

CellularAnswer numericNetworkCode(const OfonoInterfaces& interfaces) {
  const OfonoProperties& network = needed(interfaces, kNetwork);
  const std::string country = text(network, "MobileCountryCode");
  const std::string code = text(network, "MobileNetworkCode");
  // Half a code would read like another network's.
  return {textOrNull(country.empty() || code.empty() ? "" : country + code), {}};
}

CellularAnswer simStatus(const OfonoInterfaces& interfaces) {
  const OfonoProperties& sim = needed(interfaces, kSim);
  if (!needed<bool>(sim, "Present")) return {std::string("sim-missing"), {}};
  return {textOrNull(text(sim, "PinRequired")), {}};
}

CellularAnswer isInHomeCountry(const OfonoInterfaces& interfaces) {
  const std::string home = text(needed(interfaces, kSim), "MobileCountryCode");
  const std::string here = text(needed(interfaces, kNetwork), "MobileCountryCode");
  if (home.empty() || here.empty()) throw Unanswered{};
  return {home == here, {}};
}

CellularAnswer resetState(const OfonoInterfaces& interfaces) {
  const OfonoProperties& modem = needed(interfaces, kModem);
  return {needed<bool>(modem, "Powered") && !needed<bool>(modem, "Online"), {}};
}

CellularAnswer radioSelection(const OfonoInterfaces& interfaces) {
  // One setting says both what may be used and what is preferred.
  const Value preference = textOrNull(text(needed(interfaces, kRadio), "TechnologyPreference"));
  return {preference, preference};
}

CellularAnswer activeAndSupportedBands(const OfonoInterfaces& interfaces) {
  const OfonoProperties& radio = needed(interfaces, kRadio);
  ValueMap bands;
  for (const char* name : {"GsmBand", "UmtsBand"}) {
    if (std::string band = text(radio, name); !band.empty()) bands.emplace(name, std::move(band));
  }
  return {bands.empty() ? Value() : Value(std::move(bands)), {}};
}

struct DerivedRow {
  CellularQuery query;
  CellularAnswer (*derive)(const OfonoInterfaces&);
};
/// What more than one property answers. Neither the firmware's baseline nor the boot loader is here or
/// above: oFono does not know them.
constexpr std::array kDerivedRows = {
    DerivedRow{CellularQuery::numericNetworkCode, numericNetworkCode},
    DerivedRow{CellularQuery::simStatus, simStatus},
    DerivedRow{CellularQuery::isInHomeCountry, isInHomeCountry},
    DerivedRow{CellularQuery::resetState, resetState},
    DerivedRow{CellularQuery::radioSelection, radioSelection},
    DerivedRow{CellularQuery::activeAndSupportedBands, activeAndSupportedBands},
};

}  // namespace

std::optional<CellularSignal> ofonoSignal(const OfonoProperties& networkRegistration) {
  try {
    const int percentage = needed<std::uint8_t>(networkRegistration, "Strength");
    return percentage <= 100 ? std::optional(cellularSignal(percentage)) : std::nullopt;
  } catch (const Unanswered&) {
    return std::nullopt;
  }
}

Answer ofonoAnswer(CellularQuery query, const OfonoInterfaces& interfaces) {
  try {
    for (const PropertyRow& row : kPropertyRows) {
      if (row.query == query) return CellularAnswer{valueOf(row, needed(interfaces, row.interface)), {}};
    }
    for (const DerivedRow& row : kDerivedRows) {
      if (row.query == query) return row.derive(interfaces);
    }
  } catch (const Unanswered&) {
    return std::nullopt;
  }
  return std::nullopt;
}

}  // namespace zal
