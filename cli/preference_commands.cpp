// prefs: the switches that the agent reads while it runs.

#include <array>
#include <memory>

#include "cli/tool_context.h"
#include "platform/json_text.h"

namespace zal {
namespace {

constexpr const char* kNotification = "kLirraSyncLoggingPrefs";

struct Switch {
  std::string_view key;
  std::string_view meaning;
};

constexpr std::array kSwitches = {
    Switch{"CallLogging", "sessions are logged"},
    Switch{"VerboseCallLogging", "sessions are logged too"},
    Switch{"ConsoleOutput", "new sessions echo their checkpoints"},
    Switch{"ConsoleOutputVerbose", "new sessions echo checkpoints and descriptions"},
    Switch{"ConsoleOutputTorvik", "log and event records are echoed"},
    Switch{"ConsoleOutputRegistration", "read, without effect"},
    Switch{"ConsoleOutputLocalPreview", "read, without effect"},
    Switch{"pingtest", "every begin runs the ping tests"},
};

bool isKnown(std::string_view key) {
  for (const Switch& known : kSwitches) {
    if (known.key == key) return true;
  }
  return false;
}

ExitCode failUnknown(ToolContext& tool, const std::string& key) {
  std::string known;
  for (const Switch& one : kSwitches) known.append(known.empty() ? "" : ", ").append(one.key);
  return tool.fail(ExitCode::notFound, "there is no preference " + key, "There are: " + known + ".");
}

std::string_view valueText(std::optional<bool> value) { return value.value_or(false) ? "true" : "false"; }

std::string jsonOf(std::string_view key, std::optional<bool> value) {
  return JsonObject()
      .add("key", key)
      .add("value", value.value_or(false))
      .add("stored", value.has_value())
      .text();
}

ExitCode listPreferences(ToolContext& tool) {
  std::vector<std::string> elements;
  for (const Switch& one : kSwitches) {
    const auto value = tool.host.preference(one.key);
    elements.push_back(jsonOf(one.key, value));
    if (tool.options.json) continue;
    std::string line(one.key);
    line.resize(26, ' ');
    line.append(value ? valueText(value) : "not set");
    line.resize(35, ' ');
    tool.out << line << one.meaning << "\n";
  }
  if (tool.options.json) tool.out << jsonArray(elements) << "\n";
  return ExitCode::done;
}

ExitCode get(ToolContext& tool, const std::string& key) {
  if (!isKnown(key)) return failUnknown(tool, key);
  const auto value = tool.host.preference(key);
  tool.out << (tool.options.json ? jsonOf(key, value) : std::string(valueText(value))) << "\n";
  return ExitCode::done;
}

ExitCode set(ToolContext& tool, const std::string& key, bool value) {
  if (!isKnown(key)) return failUnknown(tool, key);
  if (const auto trouble = tool.host.setPreference(key, value)) {
    return tool.fail(ExitCode::fileTrouble, "not stored: " + *trouble,
                     "The switches are in " + tool.host.settings().preferenceFile + ".");
  }
  if (const auto trouble = tool.host.postNotification(kNotification)) {
    return tool.fail(ExitCode::notConfirmed, "stored, but the agent was not told: " + *trouble,
                     "A running agent reads it when a session begins or ends, or on SIGHUP.");
  }
  if (tool.options.json) tool.out << jsonOf(key, value) << "\n";
  return ExitCode::done;
}

}  // namespace

void addPreferenceCommands(CLI::App& app, ToolContext& tool) {
  CLI::App* const prefs = app.add_subcommand("prefs", "List, read and set the agent's switches");
  prefs->group("The agent");
  prefs->require_subcommand(1);
  prefs->footer("Examples:\n  lirractl prefs list\n  lirractl prefs set CallLogging true");

  const auto key = std::make_shared<std::string>();
  const auto value = std::make_shared<bool>(false);
  tool.onCommand(*prefs->add_subcommand("list", "All switches and what they do"),
                 [&tool] { return listPreferences(tool); });

  CLI::App* const getter = prefs->add_subcommand("get", "Print true or false; false when it was never set");
  getter->add_option("KEY", *key, "The switch")->required();
  tool.onCommand(*getter, [&tool, key] { return get(tool, *key); });

  CLI::App* const setter = prefs->add_subcommand("set", "Store a switch and tell the running agent");
  setter->add_option("KEY", *key, "The switch")->required();
  setter->add_option("VALUE", *value, "true or false")->required();
  tool.onCommand(*setter, [&tool, key, value] { return set(tool, *key, *value); });
}

}  // namespace zal
