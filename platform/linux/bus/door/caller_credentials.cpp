#include "platform/linux/bus/door/caller_credentials.h"

#include <algorithm>
#include <cstdint>

namespace zal {
namespace {

constexpr gid_t kNoGroup = static_cast<gid_t>(-1);

template <class T>
std::optional<T> entry(const std::map<std::string, sdbus::Variant>& answer, const char* key) {
  const auto place = answer.find(key);
  if (place == answer.end() || !place->second.containsValueOfType<T>()) return std::nullopt;
  return place->second.get<T>();
}

}  // namespace

std::optional<CallerCredentials> callerCredentials(const std::map<std::string, sdbus::Variant>& answer) {
  const auto user = entry<std::uint32_t>(answer, "UnixUserID");
  if (!user) return std::nullopt;
  CallerCredentials caller;
  caller.peer = {static_cast<pid_t>(entry<std::uint32_t>(answer, "ProcessID").value_or(0)), *user, kNoGroup};
  const auto groups =
      entry<std::vector<std::uint32_t>>(answer, "UnixGroupIDs").value_or(std::vector<std::uint32_t>());
  caller.groups.assign(groups.begin(), groups.end());
  return caller;
}

bool admits(const AccessPolicy& policy, const CallerCredentials& caller) {
  if (policy.admits(caller.peer)) return true;
  return std::any_of(caller.groups.begin(), caller.groups.end(), [&](gid_t group) {
    return policy.admits({caller.peer.process, caller.peer.user, group});
  });
}

}  // namespace zal
