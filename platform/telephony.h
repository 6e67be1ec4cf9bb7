#pragma once

#include <memory>
#include <optional>

namespace zal {

struct CellularSignal {
  int rssi = 0;        ///< dBm
  int percentage = 0;  ///< 0 to 100
  int graded = 0;      ///< bars, 0 to 4
};

/// An open connection to the telephony service; closed by its end. Main thread only.
class TelephonyConnection {
 public:
  virtual ~TelephonyConnection() = default;
  /// Nothing when the query failed.
  [[nodiscard]] virtual std::optional<CellularSignal> signalStrength() = 0;
};

/// The host telephony service. Main thread only.
class Telephony {
 public:
  virtual ~Telephony() = default;
  /// Nothing when the service cannot be reached.
  [[nodiscard]] virtual std::unique_ptr<TelephonyConnection> connect() = 0;
};

}  // namespace zal
