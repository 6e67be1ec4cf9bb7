// alerts: what the agent tells and asks the person at the device.

#include <algorithm>
#include <memory>

#include "cli/printable_text.h"
#include "cli/tool_context.h"
#include "platform/json_text.h"

namespace zal {
namespace {

struct AlertValues {
  bool all = false;
  std::string id;
  std::string button = "default";
  std::string text;
};

std::string jsonOf(const PostedAlert& alert) {
  JsonObject buttons;
  for (const PostedAlert::Button& button : alert.buttons) buttons.add(button.name, button.label);
  return JsonObject()
      .add("id", alert.id)
      .add("state", alert.state)
      .add("posted", alert.posted)
      .add("title", alert.title)
      .add("message", alert.message)
      .addJson("buttons", buttons.text())
      .add("takesText", alert.takesText)
      .add("answer", alert.answer)
      .text();
}

void print(ToolContext& tool, const PostedAlert& alert) {
  tool.out << alert.id << "  " << printableLine(alert.title) << "  (" << alert.state;
  if (!alert.answer.empty()) tool.out << ": " << alert.answer;
  tool.out << ", " << alert.posted << ")\n    " << printableLine(alert.message) << "\n    ";
  for (const PostedAlert::Button& button : alert.buttons)
    tool.out << button.name << ": " << printableLine(button.label) << "   ";
  tool.out << "cancel" << (alert.takesText ? "   (takes --text)" : "") << "\n";
}

ExitCode listAlertRecords(ToolContext& tool, bool all) {
  std::vector<PostedAlert> alerts = tool.host.alerts();
  if (!all) std::erase_if(alerts, [](const PostedAlert& alert) { return !alert.waits(); });
  if (tool.options.json) {
    std::vector<std::string> elements;
    elements.reserve(alerts.size());
    for (const PostedAlert& alert : alerts) elements.push_back(jsonOf(alert));
    tool.out << jsonArray(elements) << "\n";
    return ExitCode::done;
  }
  if (alerts.empty()) tool.out << (all ? "There are no alerts.\n" : "No alert waits.\n");
  for (const PostedAlert& alert : alerts) print(tool, alert);
  return ExitCode::done;
}

ExitCode answer(ToolContext& tool, const AlertValues& values, bool hasText) {
  const std::vector<PostedAlert> alerts = tool.host.alerts();
  const auto alert =
      std::find_if(alerts.begin(), alerts.end(), [&](const PostedAlert& one) { return one.id == values.id; });
  const std::string hint = "\"lirractl alerts\" shows those that wait.";
  if (alert == alerts.end()) return tool.fail(ExitCode::notFound, "there is no alert " + values.id, hint);
  if (!alert->waits())
    return tool.fail(ExitCode::notFound, "alert " + values.id + " takes no answer any more: " + alert->state,
                     hint);
  const auto hasButton = [&](const PostedAlert::Button& button) { return button.name == values.button; };
  if (values.button != "cancel" && std::none_of(alert->buttons.begin(), alert->buttons.end(), hasButton))
    return tool.fail(ExitCode::usage, "alert " + values.id + " has no button \"" + values.button + "\"",
                     hint);
  if (hasText && !alert->takesText)
    return tool.fail(ExitCode::usage, "alert " + values.id + " takes no text", hint);
  const auto text = hasText ? std::optional(values.text) : std::nullopt;
  if (const auto trouble = tool.host.answerAlert(values.id, values.button, text))
    return tool.fail(ExitCode::fileTrouble, "not answered: " + *trouble, "");
  if (tool.options.json) tool.out << JsonObject().add("result", "done").text() << "\n";
  return ExitCode::done;
}

}  // namespace

void addAlertCommands(CLI::App& app, ToolContext& tool) {
  const auto values = std::make_shared<AlertValues>();
  CLI::App* const alerts = app.add_subcommand("alerts", "The agent's alerts that wait for somebody");
  alerts->group("The agent");
  alerts->footer(
      "Examples:\n"
      "  lirractl alerts\n"
      "  lirractl alerts answer 7 --text \"no sound on the left\"\n"
      "  lirractl alerts answer 8 --button cancel");
  alerts->require_subcommand(0, 1);
  alerts->add_flag("--all", values->all, "Those as well that are over");
  alerts->callback([&tool, alerts, values] {
    if (alerts->get_subcommands().empty())
      tool.command = [&tool, values] { return listAlertRecords(tool, values->all); };
  });

  CLI::App* const answerer = alerts->add_subcommand("answer", "Answer one as its person would");
  answerer->add_option("ID", values->id, "The alert's number")->required();
  answerer->add_option("--button", values->button, "default, alternate, other or cancel")
      ->check(CLI::IsMember({"default", "alternate", "other", "cancel"}))
      ->capture_default_str();
  CLI::Option* const text = answerer->add_option("--text", values->text, "For the alert's text field");
  tool.onCommand(*answerer, [&tool, values, text] { return answer(tool, *values, text->count() != 0); });
}

}  // namespace zal
