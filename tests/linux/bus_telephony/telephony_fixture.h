#pragma once

#include <algorithm>
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
    });
  }
  /// One sample, which comes within its second.
  std::optional<CellularSignal> sample() {
    const int before = samples;
    const SteadyTime begin = clock.steadyNow();
    beginSample();
    EXPECT_TRUE(runUntil([&] { return samples > before; }));
    EXPECT_LT(clock.steadyNow() - begin, std::chrono::seconds(1));
    return lastSample;
  }
  /// Samples until there is a signal.
  bool signalComesBack() {
    return eventually([this] {
      runFor(std::chrono::milliseconds(5));  // an answer at once leaves the bus no turn
      return sample().has_value();
    });
  }
  /// The longest that the loop was away from its timers while the work ran its course on it.
  template <class Work>
  std::chrono::nanoseconds longestTurnDuring(Work work) {
    SteadyTime last = clock.steadyNow();
    std::chrono::nanoseconds longest{0};
    const ScopedTimer tick(loop, loop.callEvery(std::chrono::milliseconds(2), [&] {
      const SteadyTime now = clock.steadyNow();
      longest = std::max<std::chrono::nanoseconds>(longest, now - last);
      last = now;
    }));
    work();
    return std::max<std::chrono::nanoseconds>(longest, clock.steadyNow() - last);
  }

  TemporaryDirectory directory;
  PugixmlPropertyListWriter propertyLists;
  std::string dumped;
  int samples = 0;
  std::optional<CellularSignal> lastSample;
  std::unique_ptr<BusConnection> systemBus;
  std::unique_ptr<BusTelephony> telephony;
};

}  // namespace zal::testing
