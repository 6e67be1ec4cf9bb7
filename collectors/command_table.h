#pragma once

#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace zal {

class AgentLog;
class CommandRunner;
struct Configuration;

/// One diagnostic command. The texts may hold placeholders in braces: "{wifi}", "{cellular}" (the
/// configured interface names), "{makerWebHost}" and the other endpoints, "{SystemLogRoot}",
/// "{tools}" (our helper programs' directory), "{reader}" (the log reader's program name).
struct CommandRow {
  std::string_view id;       ///< key in `[commands]`
  std::string_view literal;  ///< as the platform expects it that the collections were laid out for
  std::string_view linux;    ///< its substitute on Linux; empty where there is none
  std::string_view file;     ///< output file
};

/// Rows that run together, in this order, into one directory.
enum class CommandGroup {
  sessionCaptures,    ///< live reader, look-back; at a session's begin
  networkConsole,     ///< rows 1 to 13 of a network dump
  wifiFiles,          ///< tail of the Wi-Fi log
  networkPower,       ///< row 14
  networkTables,      ///< rows 15 to 18
  networkNames,       ///< rows 19 to 25
  wifiRadio,          ///< row 26
  networkMachine,     ///< rows 27 and 28
  wifiProbe,          ///< rows 29 to 34
  networkRoutes,      ///< rows 35 to 40
  networkConsoleEnd,  ///< last look-back
  handover,
  sharing,
  registration,
  systemLogs,
  bluetooth,
  pushService,
};

/// Every command line of the collectors, as data: which one runs is a matter of the configured
/// profile and of `[commands]`; directories, output files and order never change. Any thread.
class CommandTable {
 public:
  /// The configuration is borrowed. Overrides of rows that do not exist are warned about, once.
  CommandTable(const Configuration& configuration, AgentLog& log);

  /// All rows of a group, in order.
  [[nodiscard]] static std::span<const CommandRow> rows(CommandGroup group);
  /// The rows of all groups, in the order of the groups, and last the one that ends the readers.
  [[nodiscard]] static std::vector<CommandRow> allRows();
  /// The row's command line in this configuration, placeholders filled in: the one of `[commands]`,
  /// else the profile's. A substitute that needs our helper programs counts as none while their
  /// directory is not configured; one that needs an endpoint that is not says so in its place.
  [[nodiscard]] std::string commandLine(const CommandRow& row) const;
  /// Starts every command of the group, in order, without waiting for any.
  void runInBackground(CommandRunner& runner, CommandGroup group, std::string_view directory) const;
  /// What ends every running log reader. It has no output file: the shell runs it as it is.
  [[nodiscard]] std::string stopReadersCommand() const;

 private:
  const Configuration& _configuration;
};

}  // namespace zal
