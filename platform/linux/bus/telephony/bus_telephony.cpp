#include "platform/linux/bus/telephony/bus_telephony.h"

#include <chrono>
#include <utility>

#include "platform/linux/bus/private_bus.h"
#include "platform/linux/bus/telephony/modem_manager_connection.h"
#include "platform/linux/bus/telephony/modem_state.h"
#include "platform/linux/bus/telephony/ofono_connection.h"

namespace zal {
namespace {

/// Of one sample in all, a bus that is yet to be connected included.
constexpr std::chrono::milliseconds kSampleLimit{900};

constexpr const char* kNoDaemon = "Neither ModemManager nor oFono gives a signal strength";

}  // namespace

BusTelephony::BusTelephony(const BusHost& host, BusConnection& systemBus)
    : _host(host), _modemManager(systemBus), _ofono(systemBus) {}

std::unique_ptr<TelephonyConnection> BusTelephony::connect() {
  if (_host.systemBus.empty()) return nullptr;
  auto bus = openPrivateBus(_host.systemBus);
  if (bus == nullptr) return nullptr;
  if (const auto owner = ownerOf(*bus, kModemManager)) {
    return openModemManager(std::move(bus), *owner, _host);
  }
  return openOfono(std::move(bus), _host.startBasebandDump);
}

void BusTelephony::sampleSignal(SignalHandler handler) {
  _mainThread.check("BusTelephony");
  if (_open) {
    handler(std::nullopt);
    return;
  }
  _open = std::move(handler);
  _limit = ScopedTimer(_host.mainLoop, _host.mainLoop.callAfter(kSampleLimit, [this] {
    _modemManager.giveUp();
    _finish(std::nullopt, ModemManagerSampler::kBusSilent);
  }));
  _modemManager.sample([this](const ModemManagerSampler::Sample& sample) {
    if (sample.isThere || !sample.trouble.empty()) {
      _finish(sample.signal, sample.trouble);
    } else {
      _sampleOfono();
    }
  });
}

void BusTelephony::_sampleOfono() {
  _ofono.sample([this](std::optional<CellularSignal> signal) { _finish(signal, signal ? "" : kNoDaemon); });
}

void BusTelephony::_finish(std::optional<CellularSignal> signal, const std::string& trouble) {
  if (!_open) return;  // what comes after the limit
  _limit.cancel();
  _noteTrouble(trouble);
  std::exchange(_open, nullptr)(signal);
}

void BusTelephony::_noteTrouble(const std::string& trouble) {
  if (trouble == _saidTrouble) return;
  _saidTrouble = trouble;
  if (trouble.empty()) {
    _host.log.notice("The cellular signal is sampled again");
  } else {
    _host.log.warning("Without the cellular signal: " + trouble);
  }
}

}  // namespace zal
