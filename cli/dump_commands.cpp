// dump and action: what the agent is asked to carry out.

#include <istream>
#include <memory>

#include "cli/action_values.h"
#include "cli/delivery.h"
#include "cli/dump_run.h"
#include "cli/tool_context.h"

namespace zal {
namespace {

constexpr std::int64_t kDumpAction = 14;
/// Bits of "displayFlags". Some bit has to be set, or the kind of install decides.
constexpr std::int64_t kPrompt = 1;
constexpr std::int64_t kNeitherPromptNorAlert = 4;

struct DumpValues {
  std::string session;
  std::string description;
  std::string flags = "0x7F";
  bool noPrompt = false;
};

struct ActionValues {
  std::int64_t number = 0;
  std::string session;
  std::vector<std::string> values;
  std::vector<std::string> texts;
};

std::string askForDescription(ToolContext& tool) {
  tool.out << "Please describe the problem briefly: " << std::flush;
  std::string line;
  std::getline(tool.in, line);
  return line;
}

/// What the person says about the problem, if anything.
std::optional<std::string> description(ToolContext& tool, const DumpValues& values, bool isGiven) {
  if (isGiven) return values.description;
  if (values.noPrompt || tool.options.json || !tool.host.isInteractive()) return std::nullopt;
  return askForDescription(tool);
}

ExitCode dump(ToolContext& tool, const DumpValues& values, bool hasDescription) {
  const auto flags = parseFlags(values.flags);
  if (!flags) {
    return tool.fail(ExitCode::usage, "\"" + values.flags + "\" is no set of flags",
                     "Give a number such as 95 or 0x5F.");
  }
  if (values.session.empty()) {
    return tool.fail(ExitCode::usage, "a dump needs a session type", "For example: lirractl dump Vistel");
  }
  DumpOrder order;
  order.session = values.session;
  order.description = description(tool, values, hasDescription);
  order.promptTitle = values.session + " Logging (lirractl " + std::to_string(tool.host.processId()) + ")";
  order.info.setInt64("collectionFlags", *flags);
  order.info.setInt64("displayFlags", order.description ? kPrompt : kNeitherPromptNorAlert);
  if (order.description) order.info.set("title", order.promptTitle);
  return DumpRun(tool, std::move(order)).run();
}

/// Returned: the one that is no "key=value".
std::optional<std::string> fill(lirra::Dictionary& info, const std::vector<std::string>& texts,
                                bool forceText) {
  for (const std::string& text : texts) {
    const auto value = parseActionValue(text, forceText);
    if (!value) return text;
    if (const auto* number = std::get_if<std::int64_t>(&value->value)) {
      info.setInt64(value->key, *number);
    } else if (const auto* truth = std::get_if<bool>(&value->value)) {
      info.setBool(value->key, *truth);
    } else {
      info.set(value->key, std::get<std::string>(value->value));
    }
  }
  return std::nullopt;
}

ExitCode action(ToolContext& tool, const ActionValues& values) {
  lirra::Dictionary info;
  auto wrong = fill(info, values.values, false);
  if (!wrong) wrong = fill(info, values.texts, true);
  if (wrong) {
    return tool.fail(ExitCode::usage, "\"" + *wrong + "\" is no key=value", "For example: useWifi=true");
  }
  if (values.number == kDumpAction && values.session.empty()) {
    return tool.fail(ExitCode::usage, "action 14 does nothing without a session type",
                     "Name one with --session TYPE.");
  }
  if (values.number == kDumpAction && tool.options.waitForAgent) {
    DumpOrder order;
    order.session = values.session;
    order.info = std::move(info);
    return DumpRun(tool, std::move(order)).run();
  }
  const bool hasInfo = !values.values.empty() || !values.texts.empty();
  return deliver(tool, [&](lirra::Client& agent) {
    return hasInfo ? agent.action(values.session, values.number, info)
                   : agent.action(values.session, values.number);
  });
}

}  // namespace

void addDumpCommands(CLI::App& app, ToolContext& tool) {
  const auto dumpValues = std::make_shared<DumpValues>();
  CLI::App* const dumper = app.add_subcommand(
      "dump", "Have everything about a service gathered into one archive, and wait for it");
  dumper->group("Actions");
  dumper->footer(
      "Examples:\n"
      "  lirractl dump Vistel                                 asks for a description on a terminal\n"
      "  lirractl dump Vistel --description \"no sound\" --flags 0x5F\n"
      "  lirractl --timeout 60 dump Vistel --no-prompt --json");
  dumper->add_option("TYPE", dumpValues->session, "Session type")->required();
  CLI::Option* const given =
      dumper->add_option("--description", dumpValues->description, "What the problem is, in a few words");
  dumper->add_option("--flags", dumpValues->flags, "What to collect, as a decimal or 0x number")
      ->type_name("N")
      ->capture_default_str();
  dumper->add_flag("--no-prompt", dumpValues->noPrompt, "Do not ask for a description")->excludes(given);
  tool.onCommand(*dumper,
                 [&tool, dumpValues, given] { return dump(tool, *dumpValues, given->count() != 0); });

  const auto actionValues = std::make_shared<ActionValues>();
  CLI::App* const actor = app.add_subcommand("action", "Have the agent carry out an action by its number");
  actor->group("Actions");
  actor->footer(
      "Whole numbers and true or false are sent as such, all else as text.\n"
      "Examples:\n"
      "  lirractl action 2                                    a network dump\n"
      "  lirractl action 15 useWifi=true --session Vistel     a ping test\n"
      "  lirractl action 14 collectionFlags=95 displayFlags=4 --session Vistel --wait");
  actor->add_option("NUMBER", actionValues->number, "The action")->required()->check(CLI::NonNegativeNumber);
  actor->add_option("VALUES", actionValues->values, "What it takes along")->type_name("KEY=VALUE ...");
  actor->add_option("--string", actionValues->texts, "Sent as text, whatever it looks like")
      ->type_name("KEY=VALUE")
      ->allow_extra_args(false);
  actor->add_option("--session", actionValues->session, "Session type")->type_name("TYPE");
  tool.onCommand(*actor, [&tool, actionValues] { return action(tool, *actionValues); });
}

}  // namespace zal
