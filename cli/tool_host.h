#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cli/archive_reader.h"
#include "platform/directory_roots.h"

namespace zal {

/// Where things are on this machine, for this user.
struct ToolSettings {
  std::string socketPath;             ///< empty: no rule gives one
  std::string configurationFile;      ///< empty: there is none, the defaults hold
  std::vector<std::string> warnings;  ///< what is wrong in the configuration file, one line each
  std::string preferenceFile;
  DirectoryRoots roots;  ///< absolute; no "~" is left
};

/// What the control tool needs of the machine besides the agent itself. Main thread only.
class ToolHost {
 public:
  virtual ~ToolHost() = default;
  [[nodiscard]] virtual const ToolSettings& settings() = 0;
  /// The stored switch of the logging domain; nothing when it was never set.
  [[nodiscard]] virtual std::optional<bool> preference(std::string_view key) = 0;
  /// Returned: why it was not stored, or nothing.
  [[nodiscard]] virtual std::optional<std::string> setPreference(std::string_view key, bool value) = 0;
  /// To every process of the machine. Returned: why it was not posted, or nothing.
  [[nodiscard]] virtual std::optional<std::string> postNotification(std::string_view name) = 0;

  [[nodiscard]] virtual ArchiveReader& archives() = 0;

  [[nodiscard]] virtual bool outputIsTerminal() const = 0;
  /// On a terminal, and nobody said NO_COLOR.
  [[nodiscard]] virtual bool wantsColour() const = 0;
  [[nodiscard]] virtual bool isSuperuser() const = 0;
  [[nodiscard]] virtual std::string absolutePath(const std::string& path) const = 0;
  [[nodiscard]] virtual std::chrono::steady_clock::time_point now() const = 0;
  virtual void pause(std::chrono::milliseconds duration) = 0;
};

}  // namespace zal
