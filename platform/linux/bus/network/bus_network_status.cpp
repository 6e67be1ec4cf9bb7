#include "platform/linux/bus/network/bus_network_status.h"

#include <memory>
#include <utility>

#include "platform/linux/bus/network/wifi_question.h"
#include "platform/linux/bus_module/bus_addresses.h"

namespace zal {

void BusNetworkStatus::sampleWifi(WifiHandler handler) {
  if (_inquiry.isOpen()) return handler(std::nullopt);
  if (!mayBeThere(_host.systemBus)) return handler(WifiSignal{});
  auto question = std::make_shared<WifiQuestion>(_host.configuration.interfaces.wifi);
  _inquiry.ask(question, [this, question, handler = std::move(handler)](InquiryEnd end) {
    // The connection itself tells of a lost bus.
    if (end != InquiryEnd::busLost) {
      if (const auto trouble = question->managerTrouble()) _managerNote.note(*trouble);
      if (const auto trouble = question->supplicantTrouble()) _supplicantNote.note(*trouble);
    }
    handler(question->signal());
  });
}

}  // namespace zal
