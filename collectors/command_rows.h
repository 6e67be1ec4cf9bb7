#pragma once

#include <span>

#include "collectors/command_table.h"

namespace zal::command_rows {

// The rows as data. In the literal lines "en0", "pdp_ip0" and "tessel" are the names of their own
// platform and stand as they are; placeholders are for what the deployment decides.
//
// A substitute has to stand in front of one redirection, so a compound is braced. It runs without a
// terminal and with an empty standard input, and nothing waits for it: whatever may hang for want of
// a daemon has a timeout. Programs that are not everywhere in the search path have their full path.

extern const CommandRow kStopReaders;  ///< has no output file

extern const std::span<const CommandRow> kSessionCaptures;
extern const std::span<const CommandRow> kNetworkConsole;
extern const std::span<const CommandRow> kWifiFiles;
extern const std::span<const CommandRow> kNetworkPower;
extern const std::span<const CommandRow> kNetworkTables;
extern const std::span<const CommandRow> kNetworkNames;
extern const std::span<const CommandRow> kWifiRadio;
extern const std::span<const CommandRow> kNetworkMachine;
extern const std::span<const CommandRow> kWifiProbe;
extern const std::span<const CommandRow> kNetworkRoutes;
extern const std::span<const CommandRow> kNetworkConsoleEnd;
extern const std::span<const CommandRow> kHandover;
extern const std::span<const CommandRow> kSharing;
extern const std::span<const CommandRow> kRegistration;
extern const std::span<const CommandRow> kSystemLogs;
extern const std::span<const CommandRow> kBluetooth;
extern const std::span<const CommandRow> kPushService;

}  // namespace zal::command_rows
