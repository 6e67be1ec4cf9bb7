#pragma once

#include <memory>
#include <string>

#include "tests/e2e/bus/played_wifi.h"
#include "tests/e2e/dump_fixture.h"
#include "tests/support/emulated_modem.h"

namespace zal::testing {

/// The real daemon on a private bus, with the real ModemManager, whose modem is emulated, and a Wi-Fi
/// that is played.
class BusE2eFixture : public DumpFixture {
 protected:
  void SetUp() override {
    for (const std::string& obstacle :
         {PrivateBus::obstacle(), PlayedDaemon::obstacle(), RealModemManager::obstacle()}) {
      if (!obstacle.empty()) GTEST_SKIP() << obstacle;
    }
    bus = std::make_unique<PrivateBus>();
    sandbox.bus = bus->address();
  }

  void startModem(const std::vector<std::string>& settings = {}) {
    modem = std::make_unique<EmulatedModem>(settings);
    modemManager = std::make_unique<RealModemManager>(*bus, *modem);
  }
  void startWifi(const PlayedWifi::Signal& signal) { wifi = std::make_unique<PlayedWifi>(*bus, signal); }
  void waitForPolls(std::size_t count) {
    ASSERT_TRUE(eventually([&] { return wifi->polls() >= count; }, kDeadline)) << output();
  }
  /// What ModemManager calls the strength now.
  [[nodiscard]] int percentage() const {
    const std::string answer = modemManager->property("SignalQuality");  // "(ub) 64 true"
    return answer.starts_with("(ub) ") ? std::stoi(answer.substr(5)) : -1;
  }

  std::unique_ptr<PrivateBus> bus;
  std::unique_ptr<EmulatedModem> modem;
  std::unique_ptr<RealModemManager> modemManager;
  std::unique_ptr<PlayedWifi> wifi;
};

}  // namespace zal::testing
