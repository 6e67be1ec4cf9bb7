#pragma once

#include <optional>
#include <string>

#include "platform/clock.h"

namespace zal::tessel {

class LineOutput;

/// A place where the host keeps its messages. One thread.
class LogSource {
 public:
  virtual ~LogSource() = default;
  /// Prints what is there, from `since` on when that is given. Returned: what went wrong, or nothing.
  [[nodiscard]] virtual std::optional<std::string> print(std::optional<WallTime> since,
                                                         LineOutput& output) = 0;
  /// Prints what comes from now on, and waits for it. Returned: why nothing more can come.
  [[nodiscard]] virtual std::string follow(LineOutput& output) = 0;
};

}  // namespace zal::tessel
