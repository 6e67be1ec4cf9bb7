#pragma once

#include <chrono>
#include <functional>
#include <string>
#include <string_view>

#include "platform/linux/helper/dump_files.h"
#include "platform/linux/helper/patience.h"
#include "platform/linux/modemdump/modem_daemons.h"
#include "platform/linux/modemdump/system_bus.h"

namespace zal::modemdump {

/// What a daemon's command line says about its log.
struct LogSettings {
  std::string level = "INFO";  ///< the one it has after its start
  std::string file;            ///< empty: the system's log
};
/// The arguments with a NUL behind each, as the process file system shows them.
[[nodiscard]] LogSettings logSettings(std::string_view commandLine);

/// The lines of a syslog file that ModemManager or ofonod wrote.
[[nodiscard]] std::string modemLines(std::string_view syslog);

/// "at.log": what the daemon says about its talk with the modem. ModemManager is told to say all of it
/// for that long, while `meanwhile` makes it talk, and then to go back to the level of its command
/// line: it tells nobody which one it has. Where it refuses, its log is taken as it is.
void writeDaemonLog(SystemBus& bus, const ModemDaemon& daemon, const std::string& root,
                    std::chrono::milliseconds length, const std::function<void()>& meanwhile,
                    helper::DumpFiles& files, helper::Patience& patience);

}  // namespace zal::modemdump
