#pragma once

#include <memory>
#include <optional>
#include <string>

#include "collectors/cellular_snapshot.h"
#include "platform/linux/bus/bus_connection.h"
#include "platform/linux/bus/telephony/bus_telephony.h"
#include "platform/linux/property_list/pugixml_property_list_writer.h"
#include "tests/linux/bus/bus_fixture.h"

namespace zal::testing {

/// The telephony service of an agent on a real bus.
class TelephonyFixture : public BusFixture {
 protected:
  void SetUp() override {
    BusFixture::SetUp();
    if (!IsSkipped()) useBus(bus);
  }
  void useBus(const PrivateBus& other) {
    host.systemBus = other.address();
    host.startBasebandDump = [this](std::string_view reason) { dumped = reason; };
    telephony.reset();
    systemBus = std::make_unique<BusConnection>(host, host.systemBus, "system bus");
    telephony = std::make_unique<BusTelephony>(host, *systemBus);
  }

  CellularSnapshot snapshot() { return {*telephony, propertyLists, log}; }
  std::optional<CellularAnswer> answer(CellularQuery query) {
    const auto connection = telephony->connect();
    return connection != nullptr ? connection->query(query) : std::nullopt;
  }
  /// Begins a sample; `samples` counts the answers.
  void beginSample() {
    telephony->sampleSignal([this](std::optional<CellularSignal> signal) {
      ++samples;
      lastSample = signal;
      cameInTime = _second.isSet();
    });
  }
  /// One sample, which comes before a timer of a second that was set before it began: the loop runs its
  /// timers in the order in which they are due, however late it is.
  std::optional<CellularSignal> sample() {
    const int before = samples;
    _second = ScopedTimer(loop, loop.callAfter(std::chrono::seconds(1), [this] { _second = {}; }));
    beginSample();
    EXPECT_TRUE(runUntil([&] { return samples > before; }));
    EXPECT_TRUE(cameInTime);
    return lastSample;
  }
  /// Samples until there is a signal.
  bool signalComesBack() {
    return eventually([this] {
      runFor(std::chrono::milliseconds(5));  // an answer at once leaves the bus no turn
      return sample().has_value();
    });
  }
  TemporaryDirectory directory;
  PugixmlPropertyListWriter propertyLists;
  std::string dumped;
  int samples = 0;
  std::optional<CellularSignal> lastSample;
  bool cameInTime = false;
  std::unique_ptr<BusConnection> systemBus;
  std::unique_ptr<BusTelephony> telephony;

 private:
  ScopedTimer _second;
};

}  // namespace zal::testing
