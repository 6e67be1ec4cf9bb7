#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cli/agent_records.h"
#include "cli/archive_reader.h"
#include "platform/clock.h"
#include "platform/configuration.h"
#include "platform/directory_roots.h"
#include "platform/kept_store.h"

namespace zal {

/// Where things are on this machine, for this user.
struct ToolSettings {
  std::string socketPath;             ///< empty: no rule gives one
  std::string configurationFile;      ///< empty: there is none, the defaults hold
  std::vector<std::string> warnings;  ///< what is wrong in the configuration file, one line each
  std::string preferenceFile;
  DirectoryRoots roots;  ///< absolute; no "~" is left
  DiskSettings disk;
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

  /// All alerts of the agent, the oldest first.
  [[nodiscard]] virtual std::vector<PostedAlert> alerts() = 0;
  /// Returned: why it was not answered, or nothing. `button` is a name of PostedAlert's or "cancel".
  [[nodiscard]] virtual std::optional<std::string> answerAlert(const std::string& id,
                                                               const std::string& button,
                                                               const std::optional<std::string>& text) = 0;
  /// All collections of the agent that are recorded, the oldest first.
  [[nodiscard]] virtual std::vector<DumpView> dumps() = 0;
  /// Nothing while it is not worth a word.
  [[nodiscard]] virtual std::optional<MemoryView> memory() = 0;

  /// What the agent keeps on the disk. The tool removes nothing of it.
  [[nodiscard]] virtual KeptStore& kept() = 0;

  /// A person types, and sees what is printed.
  [[nodiscard]] virtual bool isInteractive() const = 0;
  /// Columns of the terminal that is printed to; 0 when there is none whose last line can be redrawn.
  [[nodiscard]] virtual std::size_t redrawWidth() const = 0;
  [[nodiscard]] virtual bool outputIsTerminal() const = 0;
  /// On a terminal, and nobody said NO_COLOR.
  [[nodiscard]] virtual bool wantsColour() const = 0;
  [[nodiscard]] virtual bool isSuperuser() const = 0;
  [[nodiscard]] virtual std::int64_t processId() const = 0;
  [[nodiscard]] virtual std::string absolutePath(const std::string& path) const = 0;
  [[nodiscard]] virtual std::chrono::steady_clock::time_point now() const = 0;
  [[nodiscard]] virtual WallTime wallNow() const = 0;
  /// "2024-05-02 14:03:07", as the local calendar has it.
  [[nodiscard]] virtual std::string timeText(WallTime moment) const = 0;
  virtual void pause(std::chrono::milliseconds duration) = 0;
};

}  // namespace zal
