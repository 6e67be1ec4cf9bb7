#pragma once

#include <memory>
#include <optional>
#include <string>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/linux/bus/bus_connection.h"
#include "platform/telephony.h"

namespace zal {

/// Asks oFono for the signal strength over the connection that the main thread shares, in three short
/// questions: who has the name, which modem is in use, how strong is its network. Nothing is kept
/// between two samples, and no daemon is started. Main thread only.
class OfonoSignalSampler {
 public:
  explicit OfonoSignalSampler(BusConnection& systemBus) : _systemBus(systemBus) {}
  OfonoSignalSampler(const OfonoSignalSampler&) = delete;
  OfonoSignalSampler& operator=(const OfonoSignalSampler&) = delete;

  /// As Telephony::sampleSignal, within 600 milliseconds.
  void sample(Telephony::SignalHandler handler);

 private:
  template <typename Question>
  void _ask(Question question);
  void _askForOwner();
  void _askForModems(const std::string& owner);
  void _askForNetwork(const std::string& owner, const std::string& modem);
  void _answer(std::optional<CellularSignal> signal);

  BusConnection& _systemBus;
  Telephony::SignalHandler _open;
  sdbus::IConnection* _connection = nullptr;  ///< the shared one, while it is there
  // Each is replaced by a later question's alone: a proxy must outlive the answer that it is handing out.
  std::unique_ptr<sdbus::IProxy> _bus;
  std::unique_ptr<sdbus::IProxy> _manager;
  std::unique_ptr<sdbus::IProxy> _network;
  std::unique_ptr<BusConnection::User> _user;
};

}  // namespace zal
