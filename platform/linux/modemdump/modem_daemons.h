#pragma once

#include <optional>
#include <string>
#include <vector>

#include "platform/linux/helper/dump_files.h"
#include "platform/linux/modemdump/system_bus.h"

namespace zal::modemdump {

/// Which daemon has the modems of this host, and answers.
struct ModemDaemon {
  enum class Kind { none, modemManager, ofono };
  Kind kind = Kind::none;
  std::vector<std::string> modems;  ///< their paths
};

/// Writes "state.json", all that the daemon tells about its modems: ModemManager's objects, else what
/// oFono's modems have in their interfaces. A daemon that does not run is not started.
[[nodiscard]] ModemDaemon writeModemState(SystemBus& bus, helper::DumpFiles& files);

/// "cells.json": the serving and neighbour cells of ModemManager's modems. They ask the modem itself.
void writeCells(SystemBus& bus, const ModemDaemon& daemon, helper::DumpFiles& files);

}  // namespace zal::modemdump
