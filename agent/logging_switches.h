#pragma once

#include <string_view>

#include "platform/preference_store.h"

namespace zal {

inline constexpr std::string_view kLoggingDomain = "com.vendel.logging";
/// System-wide: somebody changed the stored preferences.
inline constexpr std::string_view kSyncPreferencesNotification = "kLirraSyncLoggingPrefs";

/// What a user switched on, as it was when the preferences were last read. All off until the first
/// read. Main thread only.
class LoggingSwitches {
 public:
  bool VerboseCallLogging = false;
  bool CallLogging = false;
  bool ConsoleOutput = false;
  bool ConsoleOutputVerbose = false;
  bool ConsoleOutputTorvik = false;

  /// Reads every key afresh, in a fixed order; a missing one, or one that is not a boolean, is off.
  /// Returned: the local-preview switch, which nothing in the agent depends on.
  bool read(PreferenceStore& preferences);

  [[nodiscard]] bool isCallLoggingEnabled() const { return CallLogging || VerboseCallLogging; }
  [[nodiscard]] bool isVerboseConsoleOutput() const { return ConsoleOutputVerbose; }
  [[nodiscard]] bool isConsoleOutput() const { return ConsoleOutput || ConsoleOutputVerbose; }
};

}  // namespace zal
