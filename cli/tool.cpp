#include "cli/tool.h"

#include <exception>

#include "cli/printable_text.h"
#include "cli/tool_context.h"
#include "platform/json_text.h"

namespace zal {
namespace {

constexpr const char* kFooter = R"(Examples:
  lirractl prefs set CallLogging true     sessions are logged only when this is on
  lirractl begin Vistel --initiator
  lirractl checkpoint Vistel "Invite sent"
  lirractl metric Vistel rtt-ms 41.5
  lirractl end Vistel                     carried out three seconds later
  lirractl sessions show Vistel
  lirractl dump Vistel --description "no sound"
  lirractl verify ARCHIVE                 is it whole, and what is missing in it

A request command ends when the agent has confirmed that it handled the request. TYPE is the kind of
session: Vistel, Registration, Nexa, Messages or any other name. Text that begins with a dash goes
after "--". Each command has a --help of its own.

Exit codes:
  0  done
  1  the agent is not reachable, turned the request away, or did not confirm it
  2  wrong usage
  3  not found: a session, a preference, an alert, a file
  4  a file could not be read or written
  5  the agent took the request, but no archive came of it: the dump failed or was cut off
  6  verify: the archive is as it was made, but something that was wanted is missing in it
  7  verify: the archive is damaged)";

void addGlobalOptions(CLI::App& app, ToolOptions& options) {
  app.add_option("--socket", options.socketPath, "The agent's socket, instead of the usual place")
      ->type_name("PATH");
  app.add_option("--sender", options.sender, "The name that requests carry")
      ->type_name("NAME")
      ->capture_default_str();
  app.add_option("--timeout", options.timeoutSeconds,
                 "Seconds to wait for the agent: 2 for a confirmation, 600 for a dump when not given")
      ->type_name("SECONDS")
      ->check(CLI::Range(0.0, 86'400.0));
  app.add_flag("--wait", options.waitForAgent, "Wait for an agent to appear, within the timeout");
  app.add_flag("--json", options.json, "Print for programs: one JSON value on the standard output");
}

}  // namespace

ExitCode ToolContext::fail(ExitCode code, std::string_view trouble, std::string_view hint) {
  err << "lirractl: " << printableLine(trouble) << "\n";
  if (!hint.empty()) err << "  " << printableLine(hint) << "\n";
  if (options.json) {
    out << JsonObject()
               .add("result", "failed")
               .add("exitCode", static_cast<std::int64_t>(code))
               .add("trouble", trouble)
               .add("hint", hint)
               .text()
        << "\n";
  }
  return code;
}

int runTool(const std::vector<std::string>& arguments, ToolHost& host, std::istream& in, std::ostream& out,
            std::ostream& err) {
  ToolContext tool{host, in, out, err, {}, {}};
  CLI::App app("Sends requests to the logging agent, sets its preferences and shows what it has logged.",
               "lirractl");
  app.footer(kFooter);
  app.require_subcommand(1);
  app.fallthrough();
  app.set_version_flag("--version", "lirractl " LIRRA_VERSION);
  addGlobalOptions(app, tool.options);
  addSessionCommands(app, tool);
  addRecordCommands(app, tool);
  addDumpCommands(app, tool);
  addAlertCommands(app, tool);
  addPreferenceCommands(app, tool);
  addSessionTreeCommands(app, tool);
  addVerifyCommand(app, tool);
  addDiskCommand(app, tool);
  addStatusCommand(app, tool);

  try {
    std::vector<std::string> reversed(arguments.rbegin(), arguments.rend());
    app.parse(std::move(reversed));
  } catch (const CLI::ParseError& error) {
    return app.exit(error, out, err) == 0 ? 0 : static_cast<int>(ExitCode::usage);
  }
  ExitCode code = ExitCode::fileTrouble;
  try {
    code = tool.command();
  } catch (const std::exception& error) {
    return static_cast<int>(tool.fail(ExitCode::fileTrouble, std::string("gave up: ") + error.what(), ""));
  }
  if (!out.flush()) {
    err << "lirractl: the output could not be written\n";
    return static_cast<int>(ExitCode::fileTrouble);
  }
  return static_cast<int>(code);
}

}  // namespace zal
