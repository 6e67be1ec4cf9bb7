// sessions: what the agent has written out.

#include <memory>

#include "cli/printable_text.h"
#include "cli/session_logs.h"
#include "cli/session_tree.h"
#include "cli/table_text.h"
#include "cli/tool_context.h"
#include "platform/json_text.h"
#include "platform/size_text.h"

namespace zal {
namespace {

struct Shown {
  std::string session;
  bool simple = false;
  bool verbose = false;
  bool quality = false;
};

std::string root(ToolContext& tool) { return tool.host.settings().roots.DiagnosticReportRoot; }

std::string jsonOf(const SessionDirectory& session) {
  std::vector<std::string> files;
  for (const SessionFile& file : session.files) {
    files.push_back(JsonObject().add("path", file.path).add("bytes", file.bytes).text());
  }
  return JsonObject()
      .add("type", session.type)
      .add("started", session.started)
      .add("zone", session.zone)
      .add("role", session.role)
      .add("directory", session.path)
      .add("archived", session.isArchive)
      .add("bytes", session.bytes())
      .addJson("files", jsonArray(files))
      .text();
}

ExitCode listSessions(ToolContext& tool) {
  const std::vector<SessionDirectory> sessions = findSessions(root(tool), tool.host.archives());
  if (tool.options.json) {
    std::vector<std::string> elements;
    elements.reserve(sessions.size());
    for (const SessionDirectory& session : sessions) elements.push_back(jsonOf(session));
    tool.out << jsonArray(elements) << "\n";
    return ExitCode::done;
  }
  if (sessions.empty()) {
    tool.out << "No sessions in " << printableLine(root(tool)) << "\n";
    return ExitCode::done;
  }
  std::size_t typeWidth = 4;
  for (const SessionDirectory& session : sessions)
    typeWidth = std::max(typeWidth, printableLine(session.type).size());
  const auto row = [&](const std::string& started, const std::string& type, const std::string& role,
                       const std::string& files, const std::string& size, const std::string& directory) {
    tool.out << padded(started, 26) << "  " << padded(type, typeWidth) << "  " << padded(role, 9) << "  "
             << padded(files, 5, true) << "  " << padded(size, 10, true) << "  " << directory << "\n";
  };
  row("STARTED", "TYPE", "ROLE", "FILES", "SIZE", "DIRECTORY");
  for (const SessionDirectory& session : sessions) {
    row(session.started + " " + printableLine(session.zone), printableLine(session.type), session.role,
        std::to_string(session.files.size()), sizeText(session.bytes()), printableLine(session.path));
  }
  return ExitCode::done;
}

/// The session that a type or a directory names; of a type, and of none, the latest.
std::optional<SessionDirectory> findSession(ToolContext& tool, const std::string& name) {
  if (name.find('/') != std::string::npos)
    return readSession(tool.host.absolutePath(name), tool.host.archives());
  for (SessionDirectory& session : findSessions(root(tool), tool.host.archives())) {
    if (name.empty() || session.type == name) return std::move(session);
  }
  return std::nullopt;
}

std::string readLog(ToolContext& tool, const SessionDirectory& session, SessionLog log) {
  const auto name = sessionLogName(session, log);
  return name ? readSessionFile(session, *name, tool.host.archives()).value_or("") : "";
}

/// A log comes from clients: on a terminal none of it may steer the terminal.
std::string shown(ToolContext& tool, const std::string& text) {
  return tool.host.outputIsTerminal() ? printableLines(text) : text;
}

ExitCode showOneLog(ToolContext& tool, const SessionDirectory& session, SessionLog log) {
  const auto name = sessionLogName(session, log);
  if (!name)
    return tool.fail(ExitCode::notFound, "the session has no such log: " + session.path,
                     "See \"lirractl sessions show\".");
  const auto text = readSessionFile(session, *name, tool.host.archives());
  const std::string path = session.path + "/" + *name;
  if (!text) return tool.fail(ExitCode::fileTrouble, "cannot read " + path, "");
  if (tool.options.json) {
    tool.out << JsonObject().add("path", path).add("text", *text).text() << "\n";
  } else {
    tool.out << shown(tool, *text);
  }
  return ExitCode::done;
}

ExitCode showJson(ToolContext& tool, const SessionDirectory& session) {
  std::vector<std::string> statistics;
  for (const MetricBlock& block : statisticsBlocks(readLog(tool, session, SessionLog::quality))) {
    statistics.push_back(JsonObject()
                             .add("metric", block.name)
                             .add("average", block.average)
                             .add("min", block.minimum)
                             .add("max", block.maximum)
                             .add("median", block.median)
                             .add("stddev", block.standardDeviation)
                             .text());
  }
  tool.out << JsonObject()
                  .addJson("session", jsonOf(session))
                  .add("log", readLog(tool, session, SessionLog::simple))
                  .addJson("statistics", jsonArray(statistics))
                  .text()
           << "\n";
  return ExitCode::done;
}

ExitCode showSummary(ToolContext& tool, const SessionDirectory& session) {
  const bool colour = tool.host.wantsColour();
  const auto heading = [&](const std::string& text) {
    tool.out << (colour ? "\x1b[1m" : "") << text << (colour ? "\x1b[0m" : "") << "\n";
  };
  heading(printableLine(session.path));
  for (const SessionFile& file : session.files) {
    tool.out << padded(sizeText(file.bytes), 12, true) << "  " << printableLine(file.path) << "\n";
  }
  tool.out << "\n";
  heading("Log");
  tool.out << shown(tool, readLog(tool, session, SessionLog::simple));
  const auto blocks = statisticsBlocks(readLog(tool, session, SessionLog::quality));
  if (blocks.empty()) return ExitCode::done;
  tool.out << "\n";
  heading("Statistics");
  for (const MetricBlock& block : blocks) tool.out << shown(tool, block.text);
  return ExitCode::done;
}

ExitCode show(ToolContext& tool, const Shown& wanted) {
  const auto session = findSession(tool, wanted.session);
  if (!session) {
    const std::string what = wanted.session.empty() ? "there is no session in " + root(tool)
                                                    : "there is no session " + wanted.session;
    return tool.fail(ExitCode::notFound, what, "\"lirractl sessions list\" shows what there is.");
  }
  if (wanted.simple) return showOneLog(tool, *session, SessionLog::simple);
  if (wanted.verbose) return showOneLog(tool, *session, SessionLog::verbose);
  if (wanted.quality) return showOneLog(tool, *session, SessionLog::quality);
  return tool.options.json ? showJson(tool, *session) : showSummary(tool, *session);
}

}  // namespace

void addSessionTreeCommands(CLI::App& app, ToolContext& tool) {
  CLI::App* const sessions =
      app.add_subcommand("sessions", "List and show the sessions that were written out");
  sessions->group("The agent");
  sessions->require_subcommand(1);
  sessions->footer("Examples:\n  lirractl sessions list\n  lirractl sessions show Vistel --verbose");

  CLI::App* const lister = sessions->add_subcommand("list", "All sessions, the latest first");
  tool.onCommand(*lister, [&tool] { return listSessions(tool); });

  const auto wanted = std::make_shared<Shown>();
  CLI::App* const shower =
      sessions->add_subcommand("show", "The latest session's files, simple log and statistics");
  shower->add_option("SESSION", wanted->session,
                     "A session type, or a session's directory or archive (with a \"/\")");
  CLI::Option* const simple = shower->add_flag("--log", wanted->simple, "The simple log alone, as it is");
  CLI::Option* const verbose = shower->add_flag("--verbose", wanted->verbose, "The verbose log alone");
  CLI::Option* const quality = shower->add_flag("--quality", wanted->quality, "The quality log alone");
  verbose->excludes(simple);
  quality->excludes(simple)->excludes(verbose);
  tool.onCommand(*shower, [&tool, wanted] { return show(tool, *wanted); });
}

}  // namespace zal
