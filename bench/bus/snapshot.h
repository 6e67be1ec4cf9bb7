#pragma once

#include "tests/support/emulated_modem.h"
#include "tests/support/private_bus.h"

namespace zal::bench {

struct SnapshotSeconds {
  double ours = 0;   ///< a connection of its own, all questions, the dictionary
  double mmcli = 0;  ///< `mmcli -m any -J` from its start to its end; 0 when it fails
};

/// The modem's whole state, of a real ModemManager, in turn by the agent's collector and by mmcli;
/// medians. Nothing measured when the collector gets no state.
[[nodiscard]] SnapshotSeconds measureSnapshots(const testing::PrivateBus& bus, unsigned rounds);

}  // namespace zal::bench
