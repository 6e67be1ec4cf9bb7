#pragma once

#include <string>

#include "platform/linux/helper/dump_files.h"
#include "platform/linux/helper/patience.h"
#include "platform/linux/modemdump/modem_daemons.h"

namespace zal::modemdump {

/// "mmcli.json": what ModemManager's own tool says, when ModemManager answers.
void writeToolOutput(const ModemDaemon& daemon, helper::DumpFiles& files, helper::Patience& patience);

/// "qmi.txt" and "mbim.txt": what the modem itself answers through its control devices (`/dev/cdc-wdm*`
/// below the root), where there are any; through the proxies, so that the daemon is not disturbed.
void writeControlDevices(const std::string& root, helper::DumpFiles& files, helper::Patience& patience);

}  // namespace zal::modemdump
