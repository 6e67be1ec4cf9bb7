#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>

#include "platform/value.h"

namespace zal {

/// A message to the person who holds the device, with up to three buttons and one line to fill in.
struct UserAlert {
  struct TextField {
    std::string title;
    std::string initialValue;
  };
  std::string identifier;  ///< names the kind of alert, not the alert
  std::string title;
  std::string message;
  std::string defaultButton;
  std::optional<std::string> alternateButton;
  std::optional<std::string> otherButton;
  std::optional<TextField> textField;
  double timeout = 0;  ///< seconds; 0: it waits as long as the agent lives
  int level = 0;       ///< urgency, 0 to 3
  unsigned displayFlags = 0;
  std::map<std::string, std::string> information;  ///< for programs: what the alert is about
};

/// What the person did.
struct AlertResponse {
  static constexpr int kDefaultButton = 0;
  static constexpr int kAlternateButton = 1;
  static constexpr int kOtherButton = 2;
  static constexpr int kCancelled = 3;  ///< closed without a button, or timed out
  int code = kCancelled;
  Value textFieldValue;  ///< null when the alert has no text field
};

/// The host's alerts. Any thread; posting never waits for a person, a screen or a disk that hangs.
class UserAlerts {
 public:
  /// Runs on the main thread, at most once; not at all when nobody ever answers.
  using Listener = std::function<void(const AlertResponse&)>;
  virtual ~UserAlerts() = default;
  virtual void post(UserAlert alert, Listener listener) = 0;
};

}  // namespace zal
