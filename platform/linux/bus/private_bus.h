#pragma once

#include <chrono>
#include <memory>
#include <optional>
#include <string>

#include <sdbus-c++/sdbus-c++.h>

namespace zal {

/// How long a thread that may wait gives a daemon for one answer. A healthy one takes milliseconds.
inline constexpr std::chrono::milliseconds kAnswerLimit{1000};

/// A connection at that address. Throws sdbus::Error when there can be none, or when the bus says nothing
/// within kAnswerLimit: for threads that may wait.
[[nodiscard]] std::unique_ptr<sdbus::IConnection> openBus(const std::string& address);
/// A connection of the caller's own, for calls that wait: for queue threads, never the main one. Calls
/// on it without a limit of their own end after kAnswerLimit. Nothing when the bus cannot be reached.
[[nodiscard]] std::unique_ptr<sdbus::IConnection> openPrivateBus(const std::string& address);
/// The unique name of a service that is there now, if it is and the bus answers; the question starts none.
/// Calls to that one never start a service, not even when it dies between two of them.
[[nodiscard]] std::optional<std::string> ownerOf(sdbus::IConnection& bus, const std::string& serviceName);

}  // namespace zal
