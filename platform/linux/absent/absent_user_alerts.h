#pragma once

#include "platform/user_alerts.h"

namespace zal {

/// For a host without a place for alerts: nobody sees them, nobody answers. Any thread.
class AbsentUserAlerts : public UserAlerts {
 public:
  void post(UserAlert /*alert*/, Listener /*listener*/) override {}
};

}  // namespace zal
