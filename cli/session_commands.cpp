// begin, end and everything that a session can be told.

#include <charconv>
#include <filesystem>
#include <iterator>
#include <memory>
#include <variant>

#include "cli/delivery.h"
#include "cli/tool_context.h"
#include "platform/value.h"

namespace zal {
namespace {

struct SessionValues {
  std::string session;
  std::string first;
  std::string second;
  std::string kind = "auto";
  std::int64_t beginFlags = 0;
  std::int64_t endFlags = 0;
  bool initiator = false;
  bool ping = false;
  bool captureLog = false;
  double time = LIRRA_NOW;
};

using SharedValues = std::shared_ptr<SessionValues>;

CLI::App* command(CLI::App& app, const char* name, const char* about, const char* example) {
  CLI::App* const result = app.add_subcommand(name, about);
  result->group("Sessions");
  result->footer(std::string("Example:\n  ") + example);
  return result;
}

void addType(CLI::App& app, const SharedValues& values, bool required = true) {
  app.add_option("TYPE", values->session, "Session type; \"\" is the default session")->required(required);
}

void addTime(CLI::App& app, const SharedValues& values) {
  app.add_option("--time", values->time, "Seconds since 1970; now when not given")
      ->type_name("SECONDS")
      ->check(CLI::NonNegativeNumber);
}

/// "-" stands for the standard input.
std::string textOrInput(ToolContext& tool, const std::string& text) {
  if (text != "-") return text;
  return {std::istreambuf_iterator<char>(tool.in), std::istreambuf_iterator<char>()};
}

template <class Type>
bool parsesAs(const std::string& text, Type& value) {
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
  return error == std::errc() && end == text.data() + text.size();
}

/// The number as the kind it looks like, or as the one that was asked for.
std::optional<Number> parseNumber(const std::string& text, const std::string& kind) {
  std::int64_t integer = 0;
  if ((kind == "auto" || kind == "int") && parsesAs(text, integer)) return integer;
  std::uint64_t natural = 0;
  if ((kind == "auto" || kind == "uint") && parsesAs(text, natural)) return natural;
  double real = 0;
  if ((kind == "auto" || kind == "real") && parsesAs(text, real)) return real;
  return std::nullopt;
}

ExitCode sendMetric(ToolContext& tool, const SessionValues& values) {
  const auto number = parseNumber(values.second, values.kind);
  if (!number) {
    return tool.fail(ExitCode::usage, "\"" + values.second + "\" is no number of that kind",
                     "Give a number such as 41.5, and --kind int, uint or real only to force one.");
  }
  return deliver(tool, [&](lirra::Client& agent) {
    return std::visit([&](auto value) { return agent.callMetric(values.session, values.first, value); },
                      *number);
  });
}

ExitCode sendFile(ToolContext& tool, const SessionValues& values, bool hasCategory) {
  const std::string path = tool.host.absolutePath(values.first);
  std::error_code error;
  if (!std::filesystem::exists(path, error)) {
    return tool.fail(ExitCode::notFound, "there is no file " + path,
                     "The agent takes the file when the session ends.");
  }
  return deliver(tool, [&](lirra::Client& agent) {
    return agent.addLogFile(values.session, hasCategory ? lirra::Text(values.second) : lirra::Text(nullptr),
                            path);
  });
}

void addBeginAndEnd(CLI::App& app, ToolContext& tool, const SharedValues& values) {
  CLI::App* const begin = command(app, "begin", "Begin a session; one of the same type is ended first",
                                  "lirractl begin Vistel --initiator");
  addType(*begin, values, false);
  begin->add_flag("--initiator", values->initiator, "This device placed the call");
  begin->add_flag("--ping", values->ping, "Run the ping tests of a session's begin");
  begin->add_flag("--capture-log", values->captureLog, "Capture the system log meanwhile");
  begin->add_option("--begin-flags", values->beginFlags, "Further begin flags, as a number");
  begin->add_option("--end-flags", values->endFlags, "What to collect at the end, as a number");
  tool.onCommand(*begin, [&tool, values] {
    const std::int64_t flags = values->beginFlags | (values->ping ? LIRRA_BEGIN_PING : 0) |
                               (values->captureLog ? LIRRA_BEGIN_CAPTURE_SYSTEM_LOG : 0) |
                               (values->initiator ? LIRRA_BEGIN_INITIATOR : 0);
    return deliver(tool, [&](lirra::Client& agent) {
      return agent.beginSession(values->session, flags, values->endFlags);
    });
  });

  CLI::App* const end =
      command(app, "end", "End a session, which the agent does three seconds later", "lirractl end Vistel");
  addType(*end, values, false);
  tool.onCommand(*end, [&tool, values] {
    return deliver(tool, [&](lirra::Client& agent) { return agent.endSession(values->session); });
  });

  CLI::App* const pulse = command(app, "pulse", "Keep a silent session from ending", "lirractl pulse Vistel");
  addType(*pulse, values, false);
  tool.onCommand(*pulse, [&tool, values] {
    return deliver(tool, [&](lirra::Client& agent) { return agent.pulse(values->session); });
  });
}

void addEntries(CLI::App& app, ToolContext& tool, const SharedValues& values) {
  CLI::App* const checkpoint =
      command(app, "checkpoint", "Note a step of the call", "lirractl checkpoint Vistel Connected");
  addType(*checkpoint, values);
  checkpoint->add_option("TEXT", values->first, "The step")->required();
  addTime(*checkpoint, values);
  tool.onCommand(*checkpoint, [&tool, values] {
    return deliver(tool, [&](lirra::Client& agent) {
      return agent.checkpoint(values->session, values->first, values->time);
    });
  });

  CLI::App* const describe =
      command(app, "describe", "Describe something, with a log text of any number of lines",
              "ip route | lirractl describe Vistel \"Routes\" -");
  addType(*describe, values);
  describe->add_option("DESCRIPTION", values->first, "What it is about")->required();
  CLI::Option* const log =
      describe->add_option("LOG", values->second, "The text; \"-\" reads the standard input");
  addTime(*describe, values);
  tool.onCommand(*describe, [&tool, values, log] {
    const std::string text = textOrInput(tool, values->second);
    return deliver(tool, [&](lirra::Client& agent) {
      return agent.describe(values->session, values->first,
                            log->count() != 0 ? lirra::Text(text) : lirra::Text(nullptr), values->time);
    });
  });

  CLI::App* const quality =
      command(app, "quality", "Describe the call's quality", "lirractl quality Vistel audio \"two gaps\"");
  addType(*quality, values);
  quality->add_option("DESCRIPTION", values->first, "What it is about")->required();
  CLI::Option* const qualityLog =
      quality->add_option("LOG", values->second, "The text; \"-\" reads the standard input");
  tool.onCommand(*quality, [&tool, values, qualityLog] {
    const std::string text = textOrInput(tool, values->second);
    return deliver(tool, [&](lirra::Client& agent) {
      return agent.callQuality(values->session, values->first,
                               qualityLog->count() != 0 ? lirra::Text(text) : lirra::Text(nullptr));
    });
  });

  CLI::App* const metric =
      command(app, "metric", "Add one sample of a metric; the end of the session has its statistics",
              "lirractl metric Vistel rtt-ms 41.5");
  addType(*metric, values);
  metric->add_option("NAME", values->first, "The metric")->required();
  metric->add_option("VALUE", values->second, "The sample")->required();
  metric->add_option("--kind", values->kind, "auto, int, uint or real")
      ->check(CLI::IsMember({"auto", "int", "uint", "real"}))
      ->capture_default_str();
  tool.onCommand(*metric, [&tool, values] { return sendMetric(tool, *values); });
}

void addFacts(CLI::App& app, ToolContext& tool, const SharedValues& values) {
  CLI::App* const info =
      command(app, "info", "Add a header line to the session's logs", "lirractl info Vistel Codec opus");
  addType(*info, values);
  info->add_option("CATEGORY", values->first, "The line's label")->required();
  info->add_option("VALUE", values->second, "What it says")->required();
  tool.onCommand(*info, [&tool, values] {
    return deliver(tool, [&](lirra::Client& agent) {
      return agent.callInfo(values->session, values->first, values->second);
    });
  });

  CLI::App* const file = command(app, "file", "Have a file collected when the session ends",
                                 "lirractl file Vistel packets.pcap --category Media");
  addType(*file, values);
  file->add_option("PATH", values->first, "The file; the agent moves it")->required();
  CLI::Option* const category =
      file->add_option("--category", values->second, "Directory for it in the session's own");
  tool.onCommand(*file,
                 [&tool, values, category] { return sendFile(tool, *values, category->count() != 0); });

  using Setter = lirra::Result (lirra::Client::*)(lirra::Text, lirra::Text);
  const auto fact = [&](const char* name, const char* about, const char* what, const char* example,
                        Setter set) {
    CLI::App* const app2 = command(app, name, about, example);
    addType(*app2, values);
    app2->add_option(what, values->first, about)->required();
    tool.onCommand(*app2, [&tool, values, set] {
      return deliver(tool,
                     [&](lirra::Client& agent) { return (agent.*set)(values->session, values->first); });
    });
  };
  fact("initiator", "Say who called", "IDENTITY", "lirractl initiator Vistel +15550100",
       &lirra::Client::initiator);
  fact("receiver", "Say who was called", "IDENTITY", "lirractl receiver Vistel +15550101",
       &lirra::Client::receiver);
  fact("failure", "Say why the call failed", "REASON", "lirractl failure Vistel \"no route to host\"",
       &lirra::Client::failureReason);
}

}  // namespace

void addSessionCommands(CLI::App& app, ToolContext& tool) {
  const auto values = std::make_shared<SessionValues>();
  addBeginAndEnd(app, tool, values);
  addEntries(app, tool, values);
  addFacts(app, tool, values);
}

}  // namespace zal
