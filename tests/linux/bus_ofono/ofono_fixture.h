#pragma once

#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "collectors/cellular_snapshot.h"
#include "platform/linux/bus/private_bus.h"
#include "platform/linux/bus/telephony/ofono_connection.h"
#include "tests/linux/bus/bus_fixture.h"
#include "tests/support/fake_dump_services.h"

namespace zal::testing {

/// oFono alone as the telephony service.
class OfonoOnly : public Telephony {
 public:
  explicit OfonoOnly(const PrivateBus& bus) : _bus(bus) {}
  std::vector<std::string> basebandDumps;

  [[nodiscard]] std::unique_ptr<TelephonyConnection> connect() override {
    auto connection = openPrivateBus(_bus.address());
    if (connection == nullptr) return nullptr;
    return openOfono(std::move(connection),
                     [this](std::string_view reason) { basebandDumps.emplace_back(reason); });
  }
  void sampleSignal(SignalHandler handler) override { handler(std::nullopt); }

 private:
  const PrivateBus& _bus;
};

/// A line per key, in the order of the keys: "cell-id: 10203".
[[nodiscard]] std::string cellularState(Telephony& telephony, AgentLog& log);

/// A private bus on which an oFono is played, once a test has started it.
class OfonoFixture : public BusFixture {
 protected:
  void SetUp() override;
  /// The template's modem, /ril_0: registered at 80 percent. Without `withModem` a daemon that has none.
  void startOfono(bool withModem = true);
  /// From now on GetProperties of the modem's interface gives what the Python expression says.
  void answerWith(const std::string& interface, const std::string& expression,
                  const std::string& signature = "a{sv}");
  /// The same with what the template has, changed: "Strength=dbus.Byte(40)".
  void change(const std::string& interface, const std::string& changes);
  void tell(const std::string& path, const std::vector<std::string>& words);

  OfonoOnly telephony{bus};
  std::unique_ptr<MockedService> ofono;
};

}  // namespace zal::testing
