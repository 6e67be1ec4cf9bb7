#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/value.h"

namespace zal {

class AgentLog;
class PropertyListWriter;
class Telephony;

/// Asks the telephony service about the cellular state. Each call opens and closes a connection of
/// its own. Any thread; keeps no state; waits for the service for a bounded time.
class CellularSnapshot {
 public:
  static constexpr std::string_view kFileName = "CTState.plist";
  static constexpr std::string_view kFailed = "FAILED";

  CellularSnapshot(Telephony& telephony, PropertyListWriter& propertyLists, AgentLog& log)
      : _telephony(telephony), _propertyLists(propertyLists), _log(log) {}

  /// Integers, texts or other values as the service gives them, "YES", "NO" and "FAILED" by key.
  /// Empty, with a warning in the log, when the service cannot be reached.
  [[nodiscard]] ValueMap CopyCellularState();
  /// Writes that as CTState.plist into the directory, which must exist.
  void WriteCellularState(const std::string& directory);
  /// Asks for a dump of the baseband's state. Without a reason the text names the label. Returned:
  /// whether the service could be asked; the log says so too.
  bool DumpBasebandState(const std::optional<std::string>& reason, const std::string& label);

 private:
  Telephony& _telephony;
  PropertyListWriter& _propertyLists;
  AgentLog& _log;
};

}  // namespace zal
