#pragma once

#include <chrono>
#include <functional>
#include <istream>
#include <optional>
#include <ostream>
#include <string>
#include <string_view>

#include <CLI/CLI.hpp>

#include "cli/tool_host.h"

namespace zal {

/// What the tool's process ends with. docs/lirractl.md and --help say the same.
enum class ExitCode : int {
  done = 0,
  notConfirmed = 1,  ///< the agent is not reachable, turned us away, or did not confirm
  usage = 2,
  notFound = 3,
  fileTrouble = 4,
  dumpFailed = 5,  ///< the agent took the request, but no archive came of it
  incomplete = 6,  ///< the archive is as it was made, but lacks something that was wanted
  damaged = 7,     ///< the archive is not as it was made
};

/// Options that every command understands.
struct ToolOptions {
  std::string socketPath;
  std::string sender = "lirractl";
  std::optional<double> timeoutSeconds;  ///< nothing: as the command has it
  bool waitForAgent = false;
  bool json = false;

  [[nodiscard]] std::chrono::milliseconds timeout(std::chrono::milliseconds usual) const {
    return timeoutSeconds ? std::chrono::milliseconds(static_cast<int>(*timeoutSeconds * 1000)) : usual;
  }
};

/// One run of the tool.
struct ToolContext {
  ToolHost& host;
  std::istream& in;
  std::ostream& out;
  std::ostream& err;
  ToolOptions options;
  std::function<ExitCode()> command;  ///< what the arguments asked for

  [[nodiscard]] std::string socketPath() {
    return options.socketPath.empty() ? host.settings().socketPath : options.socketPath;
  }
  /// Prints a trouble and what to do about it. With --json the trouble also goes to the output.
  ExitCode fail(ExitCode code, std::string_view trouble, std::string_view hint);
  /// The command to run when `app` was asked for.
  template <class Run>
  void onCommand(CLI::App& app, Run run) {
    app.callback([this, run] { command = run; });
  }
};

// Each group adds its commands; what they do runs after all arguments were understood.
void addSessionCommands(CLI::App& app, ToolContext& tool);
void addRecordCommands(CLI::App& app, ToolContext& tool);
void addDumpCommands(CLI::App& app, ToolContext& tool);
void addAlertCommands(CLI::App& app, ToolContext& tool);
void addPreferenceCommands(CLI::App& app, ToolContext& tool);
void addSessionTreeCommands(CLI::App& app, ToolContext& tool);
void addVerifyCommand(CLI::App& app, ToolContext& tool);
void addDiskCommand(CLI::App& app, ToolContext& tool);
void addStatusCommand(CLI::App& app, ToolContext& tool);

}  // namespace zal
