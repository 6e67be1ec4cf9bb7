#pragma once

#include "platform/user_alerts.h"

namespace zal::testing {

/// The alert that asks for a text, as a dump posts it.
inline UserAlert problemPrompt() {
  UserAlert alert;
  alert.title = "Vistel Logging";
  alert.message = "Please describe the problem briefly";
  alert.defaultButton = "OK";
  alert.alternateButton = "Cancel";
  alert.textField = UserAlert::TextField{};
  alert.level = 3;
  return alert;
}

}  // namespace zal::testing
