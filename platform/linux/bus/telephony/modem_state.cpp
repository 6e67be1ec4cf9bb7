#include "platform/linux/bus/telephony/modem_state.h"

#include <algorithm>
#include <array>
#include <tuple>

#include "platform/linux/bus/telephony/cellular_strength.h"

namespace zal {
namespace {

constexpr std::int64_t kEnabled = 6;
constexpr std::int64_t kRegistered = 8;

/// Radio technologies in the order in which a measured power is looked for.
constexpr std::array kTechnologies = {"Lte", "Nr5g", "Umts", "Gsm", "Evdo", "Cdma"};

/// Paths of equal length compare as the numbers at their ends do.
auto orderOf(const std::string& path) { return std::tuple(path.size(), path); }

int usefulnessOf(const ModemState& modem) {
  const auto* const state = modem.property<std::int64_t>(kModem, "State");
  if (state == nullptr || *state < kEnabled) return 0;
  return *state < kRegistered ? 1 : 2;
}

std::optional<double> measuredPower(const ModemState& state) {
  for (const char* technology : kTechnologies) {
    const auto* const measured = state.property<ValueMap>(kModemSignal, technology);
    const auto* const rssi = measured != nullptr ? propertyOf<double>(*measured, "rssi") : nullptr;
    if (rssi != nullptr) return *rssi;
  }
  return std::nullopt;
}

}  // namespace

const Value* ModemState::_property(std::string_view interface, std::string_view name) const {
  const auto* const properties = propertyOf<ValueMap>(interfaces, interface);
  if (properties == nullptr) return nullptr;
  const auto found = properties->find(name);
  return found != properties->end() ? &found->second : nullptr;
}

bool ModemState::isWithoutSim() const {
  const auto* const card = property<std::string>(kModem, "Sim");
  return card != nullptr && *card == "/";
}

std::vector<std::string> ModemState::bearerPaths() const {
  std::vector<std::string> paths;
  const auto* const list = property<ValueList>(kModem, "Bearers");
  if (list == nullptr) return paths;
  for (const Value& element : *list) {
    if (const auto* const bearer = element.as<std::string>()) paths.push_back(*bearer);
  }
  return paths;
}

ModemState modemInUse(const ValueMap& managedObjects) {
  std::vector<ModemState> modems;
  for (const auto& [path, object] : managedObjects) {
    const auto* const interfaces = object.as<ValueMap>();
    if (interfaces == nullptr || !interfaces->contains(kModem)) continue;
    modems.emplace_back();
    modems.back().path = path;
    modems.back().interfaces = *interfaces;
  }
  const auto best = std::min_element(modems.begin(), modems.end(), [](const auto& one, const auto& other) {
    return std::tuple(-usefulnessOf(one), orderOf(one.path)) <
           std::tuple(-usefulnessOf(other), orderOf(other.path));
  });
  return best != modems.end() ? *best : ModemState{};
}

std::optional<CellularSignal> modemSignal(const ModemState& state) {
  const auto* const quality = state.property<ValueList>(kModem, "SignalQuality");
  const auto* const percentage =
      quality != nullptr && !quality->empty() ? quality->front().as<std::uint64_t>() : nullptr;
  if (percentage == nullptr) return std::nullopt;
  return cellularSignal(static_cast<int>(std::min<std::uint64_t>(*percentage, 100)), measuredPower(state));
}

}  // namespace zal
