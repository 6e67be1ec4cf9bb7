#pragma once

#include "platform/linux/bus/bus_inquiry.h"
#include "platform/linux/bus/daemon_note.h"
#include "platform/network_status.h"

namespace zal {

/// The Wi-Fi as NetworkManager and wpa_supplicant see it, over the system bus. Starts neither; while
/// nobody samples, nothing is left on the bus. The log says when one of them falls silent and when it
/// is back. Main thread only.
class BusNetworkStatus : public NetworkStatus {
 public:
  BusNetworkStatus(const BusHost& host, BusConnection& systemBus, BusInquiry::Limits limits = {})
      : _host(host),
        _inquiry(host, systemBus, limits),
        _managerNote(host.log, "NetworkManager"),
        _supplicantNote(host.log, "wpa_supplicant") {}
  void sampleWifi(WifiHandler handler) override;

 private:
  const BusHost& _host;
  BusInquiry _inquiry;
  DaemonNote _managerNote;
  DaemonNote _supplicantNote;
};

}  // namespace zal
