// log and event: records of the agent's log sets, without a session.

#include <iterator>
#include <memory>

#include "cli/delivery.h"
#include "cli/tool_context.h"

namespace zal {
namespace {

struct RecordValues {
  std::string text;
  std::string type;
  std::string category;
  std::int64_t level = 0;
  std::uint64_t time = 0;
};

using Send = lirra::Result (lirra::Client::*)(lirra::Text, lirra::Text, lirra::Text, std::int64_t,
                                              std::uint64_t);

void addRecordCommand(CLI::App& app, ToolContext& tool, const char* name, const char* about, Send send) {
  const auto values = std::make_shared<RecordValues>();
  CLI::App* const command = app.add_subcommand(name, about);
  command->group("Records");
  command->footer(std::string("Examples:\n  lirractl ") + name +
                  " \"radio is up\" --type Registration --category Net\n" + "  dmesg | tail | lirractl " +
                  name + " -");
  command->add_option("TEXT", values->text, "The text; \"-\" reads the standard input")->required();
  CLI::Option* const type = command->add_option("--type", values->type, "Log set; ZalLogging when not given");
  CLI::Option* const category = command->add_option("--category", values->category, "Stands before the text");
  command->add_option("--level", values->level, "The client's level; kept by no file");
  command->add_option("--time", values->time, "The client's own time, any unit; 0 for none");
  tool.onCommand(*command, [&tool, values, type, category, send] {
    if (values->text == "-") values->text.assign(std::istreambuf_iterator<char>(tool.in), {});
    const auto given = [](const CLI::Option* option, const std::string& text) {
      return option->count() != 0 ? lirra::Text(text) : lirra::Text(nullptr);
    };
    return deliver(tool, [&](lirra::Client& agent) {
      return (agent.*send)(given(type, values->type), given(category, values->category), values->text,
                           values->level, values->time);
    });
  });
}

}  // namespace

void addRecordCommands(CLI::App& app, ToolContext& tool) {
  addRecordCommand(app, tool, "log", "Write a log record", &lirra::Client::log);
  addRecordCommand(app, tool, "event", "Write an event record", &lirra::Client::event);
}

}  // namespace zal
