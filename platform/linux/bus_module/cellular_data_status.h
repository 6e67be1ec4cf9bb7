#pragma once

#include <functional>

namespace zal {

/// Whether a modem can carry data now.
enum class CellularData {
  available,    ///< one is registered, at home or roaming, and data is switched on
  unavailable,  ///< none is, or data is switched off
  noService,    ///< nobody here knows of modems
  noAnswer,     ///< who should know has not said it in time
};

/// What the host's modem daemons say of cellular data. Main thread only.
class CellularDataStatus {
 public:
  using Handler = std::function<void(CellularData data)>;
  virtual ~CellularDataStatus() = default;
  /// Never waits: the handler runs once, within a second, perhaps inside the call. While an earlier
  /// question is open, a new one is not answered.
  virtual void ask(Handler handler) = 0;
};

}  // namespace zal
