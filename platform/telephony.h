#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string_view>

#include "platform/value.h"

namespace zal {

struct CellularSignal {
  int rssi = 0;        ///< dBm
  int percentage = 0;  ///< 0 to 100
  int graded = 0;      ///< bars, 0 to 4
};

/// One question about the cellular state.
enum class CellularQuery {
  operatorName,
  providerName,
  allowedMode,
  numericNetworkCode,
  firmwareVersion,
  firmwareBaselineVersion,
  bootloaderVersion,
  mobileIdentity,
  simIdentity,
  subscriberIdentity,
  subscriberCountryCode,
  simStatus,
  registrationStatus,
  radioAccessTechnology,
  serviceCenterAddress,
  isInHomeCountry,  ///< yes or no, as are the next six
  ttyMode,
  isDataAttached,
  resetState,
  isDataEnabled,
  isDataDisallowed,
  internationalDataAccess,
  servingCellId,       ///< integer
  packetContextCount,  ///< integer
  radioSelection,      ///< two values: the selection and what is preferred
  activeAndSupportedBands,
  lastKnownSubscriberCountryCode,
  subscriberNetworkCode,
  currentNetworkCountryCode,
  currentNetworkCode,
};

/// What a query that succeeded gave; a null value where the service has none.
struct CellularAnswer {
  Value value;
  Value second;  ///< of radioSelection only
};

/// An open connection to the telephony service; closed by its end. Used on the thread that opened
/// it; a query may wait for the service for a bounded time.
class TelephonyConnection {
 public:
  virtual ~TelephonyConnection() = default;
  /// Nothing when the query failed.
  [[nodiscard]] virtual std::optional<CellularSignal> signalStrength() = 0;
  /// Nothing when the query failed.
  [[nodiscard]] virtual std::optional<CellularAnswer> query(CellularQuery query) = 0;
  /// Asks the service to write the baseband's state into its own logs; it goes on doing so after
  /// the connection is closed.
  virtual void dumpBasebandState(std::string_view reason) = 0;
};

/// The host telephony service.
class Telephony {
 public:
  /// Nothing when the service cannot be reached, failed, or did not answer in time.
  using SignalHandler = std::function<void(std::optional<CellularSignal> signal)>;
  virtual ~Telephony() = default;
  /// Nothing when the service cannot be reached. Any thread that may wait a while; not the main one.
  [[nodiscard]] virtual std::unique_ptr<TelephonyConnection> connect() = 0;
  /// The signal strength without a wait: opens and closes what it needs. Main thread only; the handler
  /// runs there, once, within a second, perhaps inside the call. While an earlier question is still
  /// open, a new one is answered with nothing at once.
  virtual void sampleSignal(SignalHandler handler) = 0;
};

}  // namespace zal
