#pragma once

#include <filesystem>

#include "tests/support/emulated_modem.h"
#include "tests/support/private_bus.h"

namespace zal::bench {

struct LongestWait {
  double seconds = 0;     ///< for one barrier
  unsigned barriers = 0;  ///< one after the other
};

struct LongestWaits {
  LongestWait whileModemDaemonHangs;
  LongestWait whileBusIsDead;
};

/// What a client of an agent in a sampled session waits for while the modem daemon is stopped, and then
/// while the bus is killed and started again, so many seconds each. The daemons on the bus are gone
/// afterwards.
[[nodiscard]] LongestWaits measureLongestWaits(const std::filesystem::path& programs,
                                               testing::PrivateBus& bus, testing::RealModemManager& manager,
                                               double seconds);

}  // namespace zal::bench
