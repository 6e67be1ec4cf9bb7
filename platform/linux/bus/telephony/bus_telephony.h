#pragma once

#include <memory>
#include <string>

#include "platform/linux/bus/bus_connection.h"
#include "platform/linux/bus/telephony/modem_manager_sampler.h"
#include "platform/linux/bus/telephony/ofono_signal_sampler.h"
#include "platform/linux/bus_module/bus_host.h"
#include "platform/main_thread_check.h"
#include "platform/telephony.h"

namespace zal {

/// The telephony service of a Linux phone: ModemManager, and where it is not there, oFono. No question
/// starts either of them. Why there is no signal is logged when that changes, not with every sample.
class BusTelephony : public Telephony {
 public:
  BusTelephony(const BusHost& host, BusConnection& systemBus);
  [[nodiscard]] std::unique_ptr<TelephonyConnection> connect() override;
  void sampleSignal(SignalHandler handler) override;

 private:
  void _sampleOfono();
  void _finish(std::optional<CellularSignal> signal, const std::string& trouble);
  void _noteTrouble(const std::string& trouble);

  const BusHost& _host;
  MainThreadCheck _mainThread;
  ModemManagerSampler _modemManager;
  OfonoSignalSampler _ofono;
  SignalHandler _open;
  ScopedTimer _limit;
  std::string _saidTrouble;
};

}  // namespace zal
