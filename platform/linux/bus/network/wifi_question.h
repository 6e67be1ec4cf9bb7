#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "platform/linux/bus/bus_inquiry.h"
#include "platform/linux/bus/call_group.h"
#include "platform/linux/bus/network/supplicant_link.h"
#include "platform/linux/bus/network/wifi_values.h"

namespace zal {

/// One sample of the Wi-Fi: which device is associated and how well it hears and talks.
/// NetworkManager knows the association, the strength and the rate; wpa_supplicant, where it may be
/// asked, the RSSI. Where there is no NetworkManager, wpa_supplicant is asked for all of it. Main
/// thread only.
class WifiQuestion : public BusQuestion {
 public:
  /// That interface goes before others when it is associated; it is the one that wpa_supplicant is
  /// asked for alone.
  explicit WifiQuestion(std::string interface) : _preferred(std::move(interface)) {}
  void begin(BusConversation& bus, std::function<void()> done) override;

  /// As far as it is known by now; not associated where nobody knows of any Wi-Fi. Nothing while who
  /// should know has not answered.
  [[nodiscard]] std::optional<WifiSignal> signal() const;
  // How the daemons fared; nothing for one that was not asked.
  [[nodiscard]] std::optional<BusTrouble> managerTrouble() const;
  [[nodiscard]] std::optional<BusTrouble> supplicantTrouble() const;

 private:
  struct Device {
    std::string path;
    std::string interface;
    bool isWifi = false;
    std::string accessPoint = {};  // empty: none
    std::optional<std::uint32_t> bitRate = {};
  };

  void _askManager();
  void _askKinds(const std::vector<sdbus::ObjectPath>& paths);
  void _askAssociations();
  void _askDetails(const Device& device);
  void _askSupplicantAlone();
  void _arrive(BusTrouble trouble);
  /// Nothing more comes of NetworkManager; no known association then means that there is none.
  void _endManager();

  const std::string _preferred;
  BusConversation* _bus = nullptr;
  std::function<void()> _done;
  CallGroup _calls;
  // Their unique names. Silence is the bus's own.
  BusAnswer<std::string> _manager{.trouble = BusTrouble::silent};
  BusAnswer<std::string> _supplicant{.trouble = BusTrouble::silent};
  BusTrouble _worst = BusTrouble::none;  // of NetworkManager's answers so far
  bool _hasManagerSpoken = false;        // all that it was asked for
  bool _isLinkAsked = false;
  std::vector<Device> _devices;
  std::optional<bool> _isAssociated;
  WifiValues _values;
  SupplicantLink _link;
};

}  // namespace zal
