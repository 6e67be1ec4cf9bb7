#pragma once

#include <optional>
#include <string>

#include "platform/user_alerts.h"

namespace zal {

/// A person's answer.
struct AlertAnswer {
  int code = AlertResponse::kDefaultButton;  ///< as in AlertResponse
  std::optional<std::string> text = {};      ///< for the alert's text field; nothing: left as it was
  bool isFromScreen = false;                 ///< else from a file
};

}  // namespace zal
