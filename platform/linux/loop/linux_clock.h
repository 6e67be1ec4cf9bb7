#pragma once

#include "platform/clock.h"

namespace zal {

/// The kernel's clocks and the C library's time zone. Any thread. Steady time runs on while the host
/// sleeps. The zone is the one in force when the clock was made, whatever the host is set to afterwards;
/// what follows from it (summer time) changes by itself.
class LinuxClock : public Clock {
 public:
  LinuxClock();
  [[nodiscard]] SteadyTime steadyNow() const override;
  [[nodiscard]] SteadyTime steadyNowRoughly() const override;
  [[nodiscard]] WallTime wallNow() const override;
  /// Cheap for moments of one second in a row: each thread keeps the last second taken apart.
  [[nodiscard]] LocalTime localTime(WallTime moment) const override;
  [[nodiscard]] std::optional<WallTime> momentOf(const LocalTime& time) const override;
  [[nodiscard]] std::string zoneAbbreviation() const override;
};

}  // namespace zal
