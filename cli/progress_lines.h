#pragma once

#include <chrono>
#include <cstddef>
#include <string>
#include <string_view>

#include "cli/agent_records.h"

namespace zal {

// How a collection looks to a person, line by line, without line ends. Pure functions; names in a
// record are shown so that they cannot steer a terminal.

/// "    0:05", "   12:34", " 1:02:03".
[[nodiscard]] std::string elapsedText(std::chrono::milliseconds elapsed);
/// "    0:05  step 3 of 12: network state". `number` counts from 1 and is one of the steps.
[[nodiscard]] std::string stepLine(const DumpView& dump, std::size_t number,
                                   std::chrono::milliseconds elapsed);
/// "          missing: telephony state: the host has none".
[[nodiscard]] std::string missingLine(const DumpView::Missing& missing);
/// Cut to the columns of a terminal, so that it stays one line there.
[[nodiscard]] std::string fitting(std::string_view line, std::size_t columns);

}  // namespace zal
