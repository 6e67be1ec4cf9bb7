#include "platform/linux/bus/bus_peer.h"

#include <algorithm>
#include <array>
#include <utility>

#include "platform/linux/bus/bus_value.h"

namespace zal {
namespace {

/// A shorter question is not worth asking.
constexpr std::chrono::milliseconds kShortestLimit{200};

/// What comes instead of an answer when there is nobody to give one any more.
constexpr std::array<std::string_view, 6> kSilences = {
    "org.freedesktop.DBus.Error.Timeout",        "org.freedesktop.DBus.Error.NoReply",
    "org.freedesktop.DBus.Error.ServiceUnknown", "org.freedesktop.DBus.Error.NameHasNoOwner",
    "org.freedesktop.DBus.Error.Disconnected",   "System.Error.ENOTCONN"};

bool isSilence(const std::string& errorName) {
  return std::find(kSilences.begin(), kSilences.end(), errorName) != kSilences.end();
}

}  // namespace

BusPeer::BusPeer(sdbus::IConnection& bus, std::string owner, std::string title, Clock& clock, AgentLog& log)
    : _bus(bus),
      _owner(std::move(owner)),
      _title(std::move(title)),
      _clock(clock),
      _log(log),
      _deadline(clock.steadyNow() + kTotalLimit) {}

std::optional<ValueMap> BusPeer::properties(const std::string& path, const std::string& interface) {
  auto answer = call(PeerMethod{path, "org.freedesktop.DBus.Properties", "GetAll"}, kAnswerLimit, interface);
  if (!answer || answer->empty()) return std::nullopt;
  const auto* const map = answer->front().as<ValueMap>();
  return map != nullptr ? std::optional(*map) : std::nullopt;
}

std::optional<std::chrono::milliseconds> BusPeer::_limitOf(std::chrono::milliseconds wanted) const {
  const auto left = std::chrono::floor<std::chrono::milliseconds>(_deadline - _clock.steadyNow());
  if (_isSilent || left < kShortestLimit) return std::nullopt;
  return std::min(wanted, left);
}

ValueList BusPeer::_ask(sdbus::IProxy& proxy, const sdbus::MethodCall& message,
                        std::chrono::milliseconds limit) {
  auto reply = proxy.callMethod(message, limit);
  return readValues(reply);
}

void BusPeer::_note(const sdbus::Error& error) {
  if (!isSilence(error.getName())) return;
  _isSilent = true;
  _log.warning(_title + " does not answer: " + error.getMessage());
}

}  // namespace zal
