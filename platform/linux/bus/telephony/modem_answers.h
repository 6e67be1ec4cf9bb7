#pragma once

#include <optional>
#include <string_view>

#include "platform/linux/bus/telephony/modem_state.h"
#include "platform/telephony.h"
#include "platform/value.h"

namespace zal {

/// What the modem's state says to a question; docs/telephony.md has the table. An empty text has no
/// value; what the state does not hold, or not as the type that it should be, fails. Questions that no
/// property answers (bootloaderVersion, serviceCenterAddress, servingCellId) fail, and ttyMode, for
/// which there is nothing at all.
[[nodiscard]] std::optional<CellularAnswer> modemAnswer(CellularQuery query, const ModemState& state);

// What the methods answered that have to be called for the three others.

/// From Firmware.List: (selected, list of images). No value when the images do not tell it.
[[nodiscard]] std::optional<CellularAnswer> bootloaderAnswer(const ValueList& firmwareList);
/// From the modem's own words, `+CSCA: "+15550001",145`.
[[nodiscard]] std::optional<CellularAnswer> serviceCenterAnswer(const ValueList& commandResponse);
/// From Location.GetLocation, whose entry 1 is "MCC,MNC,LAC,CI,TAC", the last three hexadecimal.
[[nodiscard]] std::optional<CellularAnswer> servingCellAnswer(const ValueList& location);

}  // namespace zal
