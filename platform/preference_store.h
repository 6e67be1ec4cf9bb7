#pragma once

#include <optional>
#include <string_view>

namespace zal {

/// The host's stored on/off switches, by application domain. Main thread only.
class PreferenceStore {
 public:
  virtual ~PreferenceStore() = default;
  /// Brings the domain up to date with what is stored; cheap when nothing changed. A store that
  /// cannot be read counts as empty; why is logged once per change.
  virtual void synchronize(std::string_view domain) = 0;
  /// The value as of the last synchronize (which the first question implies), or nothing when the
  /// key was never set or is not a boolean.
  [[nodiscard]] virtual std::optional<bool> boolean(std::string_view domain, std::string_view key) = 0;
};

}  // namespace zal
