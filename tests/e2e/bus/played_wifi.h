#pragma once

#include <cstddef>
#include <string>

#include "tests/support/played_daemon.h"

namespace zal::testing {

/// A NetworkManager and a wpa_supplicant on a private bus, with one associated device wlan0.
class PlayedWifi {
 public:
  struct Signal {
    int strength = 0;  ///< percent
    int rssi = 0;      ///< dBm
    int rate = 0;      ///< Mbit/s
  };
  PlayedWifi(const PrivateBus& bus, const Signal& signal);

  /// From the next question on.
  void set(const Signal& signal);
  /// How often somebody has asked for the signal: the last question of a sample.
  [[nodiscard]] std::size_t polls() const;

 private:
  PlayedDaemon _manager;
  PlayedDaemon _supplicant;
};

}  // namespace zal::testing
