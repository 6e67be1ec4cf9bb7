#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/linux/bus/bus_connection.h"
#include "platform/telephony.h"

namespace zal {

/// Asks ModemManager for the signal strength over the connection that the main thread shares, in two
/// short questions: who has the name, what are its modems. Nothing is kept between two samples, and
/// nothing is watched. Main thread only.
class ModemManagerSampler {
 public:
  struct Sample {
    bool isThere = false;  ///< somebody has ModemManager's name
    std::optional<CellularSignal> signal = {};
    std::string trouble =
        {};  ///< why there is no signal, as a sentence; empty when ModemManager is not there
  };
  static constexpr const char* kBusSilent = "The system bus does not answer";
  using Handler = std::function<void(const Sample& sample)>;

  explicit ModemManagerSampler(BusConnection& systemBus) : _systemBus(systemBus) {}
  ModemManagerSampler(const ModemManagerSampler&) = delete;
  ModemManagerSampler& operator=(const ModemManagerSampler&) = delete;

  /// The handler runs once, later or inside the call, unless the sample is given up before. While the
  /// bus is not connected it waits for that, without a limit: the caller has one. One at a time.
  void sample(Handler handler);
  /// The handler of the open sample does not run any more.
  void giveUp() { _open = nullptr; }

 private:
  template <class Question>
  void _try(Question question);
  void _askForOwner();
  void _askForModems(const std::string& owner);
  void _readModems(sdbus::MethodReply& reply, const sdbus::Error* error);
  void _answer(const Sample& sample);

  BusConnection& _systemBus;
  Handler _open;
  std::string _owner;
  // A proxy must outlive the answer that it hands out: each lives as long as whom it speaks to, and the
  // second is replaced in answers of the first alone.
  std::unique_ptr<sdbus::IProxy> _bus;
  std::unique_ptr<sdbus::IProxy> _manager;
  std::unique_ptr<BusConnection::User> _user;
};

}  // namespace zal
