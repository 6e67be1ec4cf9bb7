#pragma once

#include <cstdint>
#include <string>

namespace zal {

// ModemManager's numbers as texts, in the words of its own command line tool. A number that has no word
// here is its own text, in decimal.

/// The modes of a bit set, "2g|3g|4g"; "none" of an empty one.
[[nodiscard]] std::string modeNames(std::uint64_t modes);
/// The technologies of a bit set, "umts|hsdpa"; "unknown" of an empty one.
[[nodiscard]] std::string accessTechnologyNames(std::uint64_t technologies);
/// "home", "roaming", "denied" ...
[[nodiscard]] std::string registrationName(std::uint64_t state);
/// What the card waits for: "none", "sim-pin" ...
[[nodiscard]] std::string lockName(std::uint64_t lock);

}  // namespace zal
