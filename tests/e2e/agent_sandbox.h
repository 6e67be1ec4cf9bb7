#pragma once

#include <chrono>
#include <functional>
#include <string>
#include <vector>

#include "tests/support/child_program.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// Longest time that any condition of these tests may take to come true.
inline constexpr std::chrono::seconds kDeadline{180};

/// The beginning of a command that is to see no process of this machine but its own.
[[nodiscard]] std::string ownProcessIds();

/// A place of its own for one agent: configuration, preferences, socket and all roots below one
/// temporary directory.
class AgentSandbox {
 private:
  TemporaryDirectory _directory;  // first: others are made from it

 public:
  AgentSandbox();

  /// Lines of lirra.toml besides `[roots]` and `[log]`; before the agent starts. By default sessions that
  /// ended stay as they are: nothing archives them while a test looks at them.
  std::string settings = "[testing]\nclosingStageDelay = 3600\n";
  /// Lines of its section `[log]`. The machine's journal is none of these tests' business.
  std::string logSettings = "journal = false\n";
  /// Lines of its section `[commands]`. Other log readers on this machine, and those of tests beside this
  /// one, are left alone.
  std::string commandSettings = "\"captures.stop\" = 'true'\n";
  /// Lines of its section `[disk]`. How full this machine is, or how small a test's disk, is no matter here.
  std::string diskSettings = "share = 0\nkeepFree = 0\n";
  /// Where the log and report roots lie; another directory when a test wants another file system.
  std::string stateRoot;

  /// D-Bus address of both buses; by default one where there is none, whatever runs on this machine.
  std::string bus;

  void writeConfiguration() const;
  /// Replaces the stored switches by those that are named.
  void setSwitches(const std::vector<std::string>& switchedOn) const;
  /// Tells every watcher of the host that the preferences changed.
  void postPreferencesChanged() const;
  /// The agent's whole environment.
  [[nodiscard]] std::vector<std::string> environment() const;

  [[nodiscard]] std::string operator/(const std::string& name) const { return _directory / name; }
  [[nodiscard]] std::string socketPath() const { return _directory / "run/agent.socket"; }
  [[nodiscard]] std::string configurationFile() const { return _directory / "config/lirra.toml"; }
  [[nodiscard]] std::string outputFile() const { return _directory / "agent.output"; }
  [[nodiscard]] std::string logRoot() const { return stateRoot + "/Logs"; }
  [[nodiscard]] std::string reportRoot() const { return stateRoot + "/Reports"; }
  /// The one session directory of that type; empty while there is none or more than one.
  [[nodiscard]] std::string sessionDirectory(const std::string& type) const;
  /// The session's file whose name begins so ("Log", "Verbose Log", "Quality Log"), whole.
  [[nodiscard]] std::string sessionFile(const std::string& type, const std::string& name) const;
  /// All records of a log set, oldest first: rotated archives, pending ones, the current file.
  [[nodiscard]] std::string wholeLogSet(const std::string& type, const std::string& suffix = "") const;
};

/// The lines of a text, without their ends.
[[nodiscard]] std::vector<std::string> linesOf(const std::string& text);
/// The text with everything that depends on when it was written replaced: times, dates, zone.
[[nodiscard]] std::string withoutTimes(const std::string& text);

}  // namespace zal::testing
