#include "platform/linux/bus/telephony/modem_answers.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <string>

#include "platform/linux/bus/telephony/modem_names.h"

namespace zal {
namespace {

using Answer = std::optional<CellularAnswer>;

constexpr std::size_t kCountryCodeSize = 3;
constexpr std::uint64_t kRegistrationDenied = 3;

/// In its place: optimising, the compiler takes a moved value of eight kinds for one that was never set.
Answer valueAnswer(Value value) {
  Answer answer(std::in_place);
  answer->value = std::move(value);
  return answer;
}

Answer textAnswer(const std::string* text) {
  if (text == nullptr) return std::nullopt;
  return text->empty() ? CellularAnswer{} : valueAnswer(*text);
}

template <auto nameOf>
Answer nameAnswer(const std::uint64_t* number) {
  return number != nullptr ? valueAnswer(nameOf(*number)) : std::nullopt;
}

Answer modemText(const ModemState& state, const char* name) {
  return textAnswer(state.property<std::string>(kModem, name));
}

/// No card has no identity; one that could not be read fails.
Answer simText(const ModemState& state, const char* name) {
  if (state.isWithoutSim()) return CellularAnswer{};
  return state.sim ? textAnswer(propertyOf<std::string>(*state.sim, name)) : std::nullopt;
}

const std::string* simOperator(const ModemState& state) {
  return state.sim ? propertyOf<std::string>(*state.sim, "OperatorIdentifier") : nullptr;
}

const std::string* networkOperator(const ModemState& state) {
  return state.property<std::string>(kModem3gpp, "OperatorCode");
}

/// Three digits of country and two or three of network, in one.
bool isOperatorCode(const std::string& text) {
  return (text.size() == 5 || text.size() == 6) &&
         std::all_of(text.begin(), text.end(), [](char digit) { return digit >= '0' && digit <= '9'; });
}

enum class Part { country, network };

Answer codePart(const std::string* code, Part part) {
  if (code != nullptr && code->empty()) return CellularAnswer{};
  if (code == nullptr || !isOperatorCode(*code)) return std::nullopt;
  return valueAnswer(part == Part::country ? code->substr(0, kCountryCodeSize)
                                           : code->substr(kCountryCodeSize));
}

Answer simCodePart(const ModemState& state, Part part) {
  return state.isWithoutSim() ? CellularAnswer{} : codePart(simOperator(state), part);
}

Answer subscriberCountry(const ModemState& state) {
  const Answer fromOperator = simCodePart(state, Part::country);
  const bool isKnown = fromOperator && fromOperator->value.as<std::string>() != nullptr;
  if (isKnown || !state.sim) return fromOperator;
  const auto* const identity = propertyOf<std::string>(*state.sim, "Imsi");
  if (identity == nullptr || identity->empty()) return fromOperator;
  return valueAnswer(identity->substr(0, kCountryCodeSize));
}

Answer simStatus(const ModemState& state) {
  if (state.isWithoutSim()) return valueAnswer("sim-missing");
  return nameAnswer<lockName>(state.property<std::uint64_t>(kModem, "UnlockRequired"));
}

Answer isInHomeCountry(const ModemState& state) {
  const auto* const home = simOperator(state);
  const auto* const here = networkOperator(state);
  if (home == nullptr || here == nullptr || !isOperatorCode(*home) || !isOperatorCode(*here)) {
    return std::nullopt;
  }
  return valueAnswer(home->compare(0, kCountryCodeSize, *here, 0, kCountryCodeSize) == 0);
}

Answer isDataAttached(const ModemState& state) {
  constexpr std::uint64_t kUnknown = 0;
  constexpr std::uint64_t kAttached = 2;
  const auto* const service = state.property<std::uint64_t>(kModem3gpp, "PacketServiceState");
  if (service == nullptr || *service == kUnknown) return std::nullopt;
  return valueAnswer(*service == kAttached);
}

Answer isResetting(const ModemState& state) {
  constexpr std::int64_t kFailed = -1;
  constexpr std::int64_t kInitializing = 1;
  const auto* const step = state.property<std::int64_t>(kModem, "State");
  if (step == nullptr) return std::nullopt;
  return valueAnswer(*step == kFailed || *step == kInitializing);
}

Answer isAnyBearerConnected(const ModemState& state) {
  if (state.property<ValueList>(kModem, "Bearers") == nullptr) return std::nullopt;
  bool areAllKnown = true;
  for (const auto& bearer : state.bearers) {
    const bool* const isConnected = bearer ? propertyOf<bool>(*bearer, "Connected") : nullptr;
    if (isConnected != nullptr && *isConnected) return valueAnswer(true);
    areAllKnown = areAllKnown && isConnected != nullptr;
  }
  return areAllKnown ? valueAnswer(false) : std::nullopt;
}

const bool* networkManagerSwitch(const ModemState& state, const char* name) {
  return state.networkManager ? propertyOf<bool>(*state.networkManager, name) : nullptr;
}

Answer isDataEnabled(const ModemState& state) {
  if (!state.hasNetworkManager) return isAnyBearerConnected(state);
  const bool* const isEnabled = networkManagerSwitch(state, "WwanEnabled");
  return isEnabled != nullptr ? valueAnswer(*isEnabled) : std::nullopt;
}

Answer isDataDisallowed(const ModemState& state) {
  const auto* const registration = state.property<std::uint64_t>(kModem3gpp, "RegistrationState");
  const bool* const mayTransmit = networkManagerSwitch(state, "WwanHardwareEnabled");
  const bool isDenied = registration != nullptr && *registration == kRegistrationDenied;
  const bool isSwitchedOff = mayTransmit != nullptr && !*mayTransmit;
  if (isDenied || isSwitchedOff) return valueAnswer(true);
  const bool isAllKnown = registration != nullptr && (!state.hasNetworkManager || mayTransmit != nullptr);
  return isAllKnown ? valueAnswer(false) : std::nullopt;
}

Answer isRoamingAllowed(const ModemState& state) {
  if (state.bearers.empty() || !state.bearers.front()) return std::nullopt;
  const auto* const settings = propertyOf<ValueMap>(*state.bearers.front(), "Properties");
  if (settings == nullptr) return std::nullopt;
  if (!settings->contains("allow-roaming")) return valueAnswer(true);
  const bool* const isAllowed = propertyOf<bool>(*settings, "allow-roaming");
  return isAllowed != nullptr ? valueAnswer(*isAllowed) : std::nullopt;
}

Answer packetContextCount(const ModemState& state) {
  const auto* const bearers = state.property<ValueList>(kModem, "Bearers");
  if (bearers == nullptr) return std::nullopt;
  return valueAnswer(static_cast<std::int64_t>(bearers->size()));
}

/// The allowed modes and the one that is preferred among them.
Answer radioSelection(const ModemState& state) {
  const auto* const modes = state.property<ValueList>(kModem, "CurrentModes");
  if (modes == nullptr || modes->size() != 2) return std::nullopt;
  const auto* const allowed = modes->front().as<std::uint64_t>();
  const auto* const preferred = modes->back().as<std::uint64_t>();
  if (allowed == nullptr || preferred == nullptr) return std::nullopt;
  return CellularAnswer{modeNames(*allowed), modeNames(*preferred)};
}

Answer allowedMode(const ModemState& state) {
  const Answer selection = radioSelection(state);
  return selection ? valueAnswer(selection->value) : std::nullopt;
}

Answer bands(const ModemState& state) {
  const auto* const current = state.property<ValueList>(kModem, "CurrentBands");
  const auto* const supported = state.property<ValueList>(kModem, "SupportedBands");
  if (current == nullptr || supported == nullptr) return std::nullopt;
  return valueAnswer(ValueMap{{"active", *current}, {"supported", *supported}});
}

struct Row {
  CellularQuery query;
  Answer (*answer)(const ModemState& state);
};
using State = const ModemState&;
constexpr std::array kRows = {
    Row{CellularQuery::operatorName,
        [](State state) { return textAnswer(state.property<std::string>(kModem3gpp, "OperatorName")); }},
    Row{CellularQuery::providerName, [](State state) { return simText(state, "OperatorName"); }},
    Row{CellularQuery::allowedMode, &allowedMode},
    Row{CellularQuery::numericNetworkCode, [](State state) { return textAnswer(networkOperator(state)); }},
    Row{CellularQuery::firmwareVersion, [](State state) { return modemText(state, "Revision"); }},
    Row{CellularQuery::firmwareBaselineVersion,
        [](State state) { return modemText(state, "CarrierConfigurationRevision"); }},
    Row{CellularQuery::mobileIdentity, [](State state) { return modemText(state, "EquipmentIdentifier"); }},
    Row{CellularQuery::simIdentity, [](State state) { return simText(state, "SimIdentifier"); }},
    Row{CellularQuery::subscriberIdentity, [](State state) { return simText(state, "Imsi"); }},
    Row{CellularQuery::subscriberCountryCode, &subscriberCountry},
    Row{CellularQuery::simStatus, &simStatus},
    Row{CellularQuery::registrationStatus,
        [](State state) {
          return nameAnswer<registrationName>(state.property<std::uint64_t>(kModem3gpp, "RegistrationState"));
        }},
    Row{CellularQuery::radioAccessTechnology,
        [](State state) {
          return nameAnswer<accessTechnologyNames>(
              state.property<std::uint64_t>(kModem, "AccessTechnologies"));
        }},
    Row{CellularQuery::isInHomeCountry, &isInHomeCountry},
    Row{CellularQuery::isDataAttached, &isDataAttached},
    Row{CellularQuery::resetState, &isResetting},
    Row{CellularQuery::isDataEnabled, &isDataEnabled},
    Row{CellularQuery::isDataDisallowed, &isDataDisallowed},
    Row{CellularQuery::internationalDataAccess, &isRoamingAllowed},
    Row{CellularQuery::packetContextCount, &packetContextCount},
    Row{CellularQuery::radioSelection, &radioSelection},
    Row{CellularQuery::activeAndSupportedBands, &bands},
    Row{CellularQuery::lastKnownSubscriberCountryCode,
        [](State state) { return simCodePart(state, Part::country); }},
    Row{CellularQuery::subscriberNetworkCode, [](State state) { return simCodePart(state, Part::network); }},
    Row{CellularQuery::currentNetworkCountryCode,
        [](State state) { return codePart(networkOperator(state), Part::country); }},
    Row{CellularQuery::currentNetworkCode,
        [](State state) { return codePart(networkOperator(state), Part::network); }},
};

constexpr const char* kBootVersion = "gobi-boot-version";

}  // namespace

std::optional<CellularAnswer> modemAnswer(CellularQuery query, const ModemState& state) {
  const auto row =
      std::find_if(kRows.begin(), kRows.end(), [&](const Row& each) { return each.query == query; });
  return row != kRows.end() ? row->answer(state) : std::nullopt;
}

std::optional<CellularAnswer> bootloaderAnswer(const ValueList& firmwareList) {
  const auto* const selected = !firmwareList.empty() ? firmwareList.front().as<std::string>() : nullptr;
  const auto* const images = firmwareList.size() == 2 ? firmwareList.back().as<ValueList>() : nullptr;
  if (selected == nullptr || images == nullptr) return std::nullopt;
  const std::string* version = nullptr;
  for (const Value& each : *images) {
    const auto* const image = each.as<ValueMap>();
    const auto* const found = image != nullptr ? propertyOf<std::string>(*image, kBootVersion) : nullptr;
    if (found == nullptr) continue;
    const auto* const name = propertyOf<std::string>(*image, "unique-id");
    const bool isSelected = name != nullptr && *name == *selected;
    if (version == nullptr || isSelected) version = found;
    if (isSelected) break;
  }
  return version != nullptr ? textAnswer(version) : CellularAnswer{};
}

std::optional<CellularAnswer> serviceCenterAnswer(const ValueList& commandResponse) {
  const auto* const line = commandResponse.size() == 1 ? commandResponse.front().as<std::string>() : nullptr;
  if (line == nullptr || !line->starts_with("+CSCA:")) return std::nullopt;
  const std::size_t begin = line->find('"');
  const std::size_t end = begin != std::string::npos ? line->find('"', begin + 1) : begin;
  if (end == std::string::npos) return std::nullopt;
  const std::string address = line->substr(begin + 1, end - begin - 1);
  return textAnswer(&address);
}

std::optional<CellularAnswer> servingCellAnswer(const ValueList& location) {
  constexpr int kFieldsBefore = 3;
  const auto* const sources = location.size() == 1 ? location.front().as<ValueMap>() : nullptr;
  const auto* const text = sources != nullptr ? propertyOf<std::string>(*sources, "1") : nullptr;
  if (text == nullptr) return std::nullopt;
  std::string_view rest = *text;
  for (int field = 0; field < kFieldsBefore; ++field) {
    const std::size_t comma = rest.find(',');
    if (comma == std::string_view::npos) return std::nullopt;
    rest.remove_prefix(comma + 1);
  }
  rest = rest.substr(0, rest.find(','));
  std::uint64_t cell = 0;
  const auto [end, error] = std::from_chars(rest.data(), rest.data() + rest.size(), cell, 16);
  if (error != std::errc() || end != rest.data() + rest.size()) return std::nullopt;
  return valueAnswer(static_cast<std::int64_t>(cell));
}

}  // namespace zal
