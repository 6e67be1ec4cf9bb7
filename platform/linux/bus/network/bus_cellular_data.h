#pragma once

#include "platform/linux/bus/bus_inquiry.h"
#include "platform/linux/bus_module/cellular_data_status.h"

namespace zal {

/// Cellular data as ModemManager, NetworkManager and oFono tell it over the system bus. Starts none of
/// them; between questions nothing is left on the bus. Main thread only.
class BusCellularData : public CellularDataStatus {
 public:
  BusCellularData(const BusHost& host, BusConnection& systemBus, BusInquiry::Limits limits = {})
      : _host(host), _inquiry(host, systemBus, limits) {}
  void ask(Handler handler) override;

 private:
  const BusHost& _host;
  BusInquiry _inquiry;
};

}  // namespace zal
