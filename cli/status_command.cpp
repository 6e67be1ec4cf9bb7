// status: whether an agent answers, and where everything is.

#include <array>
#include <cstdio>

#include "cli/delivery.h"
#include "cli/printable_text.h"
#include "cli/tool_context.h"
#include "platform/json_text.h"

namespace zal {
namespace {

struct Root {
  std::string_view name;
  std::string DirectoryRoots::*path;
};

constexpr std::array kRoots = {
    Root{"UserLogRoot", &DirectoryRoots::UserLogRoot},
    Root{"MobileLogRoot", &DirectoryRoots::MobileLogRoot},
    Root{"DiagnosticReportRoot", &DirectoryRoots::DiagnosticReportRoot},
    Root{"WirelessLogRoot", &DirectoryRoots::WirelessLogRoot},
    Root{"WirelessReportRoot", &DirectoryRoots::WirelessReportRoot},
    Root{"RootReportRoot", &DirectoryRoots::RootReportRoot},
    Root{"SystemLogRoot", &DirectoryRoots::SystemLogRoot},
    Root{"SystemReportRoot", &DirectoryRoots::SystemReportRoot},
    Root{"NetworkConfigRoot", &DirectoryRoots::NetworkConfigRoot},
    Root{"TemporaryRoot", &DirectoryRoots::TemporaryRoot},
    Root{"RuntimeRoot", &DirectoryRoots::RuntimeRoot},
};

struct Answer {
  lirra::Result result = LIRRA_UNREACHABLE;
  std::int64_t process = 0;
  double milliseconds = 0;
  std::string trouble;
};

Answer askAgent(ToolContext& tool, lirra::Client& client) {
  Answer answer;
  answer.result = client ? confirm(tool, client) : LIRRA_UNREACHABLE;
  if (answer.result == LIRRA_OK) {
    // Once more for the time: the first answer may have waited for the agent to start.
    const auto start = tool.host.now();
    answer.result = confirm(tool, client);
    answer.milliseconds = std::chrono::duration<double, std::milli>(tool.host.now() - start).count();
  }
  answer.process = client.statistics().agent_pid;
  answer.trouble = client ? client.trouble() : "";
  return answer;
}

std::string milliseconds(double value) {
  char text[32];
  std::snprintf(text, sizeof text, "%.1f", value);
  return text;
}

/// Of the agent that answered, not of one that was killed.
std::optional<MemoryView> memoryOf(ToolContext& tool, const Answer& answer) {
  auto memory = tool.host.memory();
  if (answer.result != LIRRA_OK || (memory && memory->agent != answer.process)) return std::nullopt;
  return memory;
}

std::string mebibytes(std::uint64_t bytes) {
  char text[32];
  std::snprintf(text, sizeof text, "%.1f MiB", static_cast<double>(bytes) / (1U << 20U));
  return text;
}

std::string clientText(const MemoryView::Client& client) {
  return mebibytes(client.bytes) + " of it from process " + std::to_string(client.process) + " of user " +
         std::to_string(client.user) + "; " + std::to_string(client.delayedMessages) +
         " of its messages were delayed" + (client.waits ? "; it waits" : "");
}

std::string memoryJson(const MemoryView& memory) {
  std::vector<std::string> clients;
  for (const MemoryView::Client& client : memory.clients) {
    clients.push_back(JsonObject()
                          .add("process", client.process)
                          .add("user", client.user)
                          .add("bytes", client.bytes)
                          .add("delayedMessages", client.delayedMessages)
                          .add("waits", client.waits)
                          .text());
  }
  return JsonObject().add("bytes", memory.bytes).addJson("clients", jsonArray(clients)).text();
}

void print(ToolContext& tool, const Answer& answer) {
  const ToolSettings& settings = tool.host.settings();
  const auto row = [&](std::string name, const std::string& value) {
    name.resize(23, ' ');
    tool.out << name << printableLine(value) << "\n";
  };
  if (answer.result == LIRRA_OK) {
    row("agent", "process " + std::to_string(answer.process) + " answered in " +
                     milliseconds(answer.milliseconds) + " ms");
  } else {
    row("agent", "none answers");
  }
  if (const auto memory = memoryOf(tool, answer)) {
    row("memory", mebibytes(memory->bytes) + " of lines");
    for (const MemoryView::Client& client : memory->clients) row("", clientText(client));
  }
  const std::string socket = tool.socketPath();
  row("socket", socket.empty() ? "not known" : socket);
  row("configuration",
      settings.configurationFile.empty() ? "none; the defaults hold" : settings.configurationFile);
  row("preferences", settings.preferenceFile);
  const bool logs = tool.host.preference("CallLogging").value_or(false) ||
                    tool.host.preference("VerboseCallLogging").value_or(false);
  row("sessions are logged", logs ? "yes" : "no; \"lirractl prefs set CallLogging true\" turns it on");
  for (const Root& root : kRoots) row(std::string(root.name), settings.roots.*root.path);
}

void printJson(ToolContext& tool, const Answer& answer) {
  const ToolSettings& settings = tool.host.settings();
  JsonObject roots;
  for (const Root& root : kRoots) roots.add(root.name, settings.roots.*root.path);
  std::vector<std::string> warnings;
  for (const std::string& warning : settings.warnings) warnings.push_back(jsonString(warning));
  JsonObject status;
  status.add("running", answer.result == LIRRA_OK);
  if (answer.result == LIRRA_OK) {
    status.add("process", answer.process).addJson("answeredInMs", milliseconds(answer.milliseconds));
    if (const auto memory = memoryOf(tool, answer)) status.addJson("memory", memoryJson(*memory));
  } else {
    status.add("trouble", lirra_result_text(answer.result)).add("reason", answer.trouble);
  }
  tool.out << status.add("socket", tool.socketPath())
                  .add("configuration", settings.configurationFile)
                  .add("preferences", settings.preferenceFile)
                  .addJson("roots", roots.text())
                  .addJson("warnings", jsonArray(warnings))
                  .text()
           << "\n";
}

ExitCode status(ToolContext& tool) {
  lirra::Client client = openClient(tool);
  const Answer answer = askAgent(tool, client);
  for (const std::string& warning : tool.host.settings().warnings)
    tool.err << "lirractl: " << printableLine(warning) << "\n";
  if (tool.options.json) {
    printJson(tool, answer);
    return answer.result == LIRRA_OK ? ExitCode::done : ExitCode::notConfirmed;
  }
  print(tool, answer);
  return answer.result == LIRRA_OK ? ExitCode::done : failToDeliver(tool, answer.result, client);
}

}  // namespace

void addStatusCommand(CLI::App& app, ToolContext& tool) {
  CLI::App* const command = app.add_subcommand("status", "Whether an agent answers, and where everything is");
  command->group("The agent");
  command->footer(
      "Examples:\n  lirractl status\n  lirractl --wait --timeout 5 status   after starting the agent");
  tool.onCommand(*command, [&tool] { return status(tool); });
}

}  // namespace zal
