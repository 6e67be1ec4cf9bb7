#include "platform/linux/bus/telephony/modem_names.h"

#include <array>
#include <span>
#include <string_view>

namespace zal {
namespace {

using Names = std::span<const std::string_view>;

constexpr std::uint64_t kAny = 0xFFFFFFFF;

/// By bit, from the lowest.
constexpr std::array<std::string_view, 5> kModes = {"cs", "2g", "3g", "4g", "5g"};
constexpr std::array<std::string_view, 18> kTechnologyNames = {
    "pots",      "gsm",   "gsm-compact", "gprs",  "edge",  "umts", "hsdpa", "hsupa",     "hspa",
    "hspa-plus", "1xrtt", "evdo0",       "evdoa", "evdob", "lte",  "5gnr",  "lte-cat-m", "lte-nb-iot"};
/// By number.
constexpr std::array<std::string_view, 12> kRegistrations = {"idle",
                                                             "home",
                                                             "searching",
                                                             "denied",
                                                             "unknown",
                                                             "roaming",
                                                             "home-sms-only",
                                                             "roaming-sms-only",
                                                             "emergency-only",
                                                             "home-csfb-not-preferred",
                                                             "roaming-csfb-not-preferred",
                                                             "attached-rlos"};
constexpr std::array<std::string_view, 17> kLocks = {
    "unknown",     "none",        "sim-pin",     "sim-pin2",      "sim-puk",      "sim-puk2",
    "ph-sp-pin",   "ph-sp-puk",   "ph-net-pin",  "ph-net-puk",    "ph-sim-pin",   "ph-corp-pin",
    "ph-corp-puk", "ph-fsim-pin", "ph-fsim-puk", "ph-netsub-pin", "ph-netsub-puk"};

std::string nameOf(std::uint64_t number, Names names) {
  return number < names.size() ? std::string(names[number]) : std::to_string(number);
}

std::string bitNames(std::uint64_t bits, Names names, std::string_view nameOfNone) {
  if (bits == 0) return std::string(nameOfNone);
  if (bits == kAny) return "any";
  if (bits >> names.size() != 0) return std::to_string(bits);
  std::string text;
  for (std::size_t bit = 0; bit < names.size(); ++bit) {
    if ((bits >> bit & 1) == 0) continue;
    if (!text.empty()) text += '|';
    text += names[bit];
  }
  return text;
}

}  // namespace

std::string modeNames(std::uint64_t modes) { return bitNames(modes, kModes, "none"); }

std::string accessTechnologyNames(std::uint64_t technologies) {
  return bitNames(technologies, kTechnologyNames, "unknown");
}

std::string registrationName(std::uint64_t state) { return nameOf(state, kRegistrations); }

std::string lockName(std::uint64_t lock) { return nameOf(lock, kLocks); }

}  // namespace zal
