#pragma once

#include <optional>
#include <string>
#include <vector>

#include "platform/clock.h"
#include "platform/configuration.h"

namespace zal {

/// How long each ping of a session runs, in seconds.
inline constexpr double kSessionPingSeconds = 8.0;

/// One ping that a session asks for.
struct SessionPing {
  std::optional<std::string> address;  ///< none: the default gateway
  std::string fileName;                ///< of its results
  bool useWifi = false;
  bool operator==(const SessionPing&) const = default;
};

/// What a session pings over Wi-Fi or else over the cellular interface, in order. A report server that
/// is not configured keeps its row, and the results say that there is no such host.
[[nodiscard]] std::vector<SessionPing> sessionPings(bool useWifi, const Endpoints& endpoints,
                                                    const LocalTime& now);

}  // namespace zal
