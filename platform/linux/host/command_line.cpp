#include "platform/linux/host/command_line.h"

#include <string_view>

namespace zal {
namespace {

/// One option that has a value, and where it goes.
struct ValueOption {
  std::string_view name;
  std::optional<std::string> CommandLine::*target;
};

constexpr ValueOption kValueOptions[] = {
    {"--config", &CommandLine::configFile},
    {"--socket", &CommandLine::socketPath},
};

const ValueOption* findValueOption(std::string_view name) {
  for (const ValueOption& option : kValueOptions) {
    if (option.name == name) return &option;
  }
  return nullptr;
}

}  // namespace

CommandLine CommandLine::parse(const std::vector<std::string>& arguments) {
  CommandLine result;
  for (std::size_t i = 0; i < arguments.size(); ++i) {
    const std::string& argument = arguments[i];
    if (argument == "--help" || argument == "-h") {
      result.help = true;
      continue;
    }
    if (argument == "--version") {
      result.version = true;
      continue;
    }
    const std::size_t equals = argument.find('=');
    const std::string name = argument.substr(0, equals);
    const ValueOption* const option = findValueOption(name);
    if (option == nullptr) {
      result.trouble = "There is no option " + argument + "; try --help.";
      return result;
    }
    std::optional<std::string> value;
    if (equals != std::string::npos) {
      value = argument.substr(equals + 1);
    } else if (i + 1 < arguments.size()) {
      value = arguments[++i];
    }
    if (!value || value->empty()) {
      result.trouble = name + " wants a path behind it.";
      return result;
    }
    result.*option->target = std::move(value);
  }
  return result;
}

std::string CommandLine::helpText() {
  return R"(zalloggingagent - records what the call services of this device report

Usage: zalloggingagent [--config FILE] [--socket PATH]

  --config FILE   read FILE instead of $LIRRA_CONFIG or the lirra.toml of the user or the system
  --socket PATH   listen at PATH instead of $LIRRA_SOCKET or com.vendel.lirra in the runtime directory
  --version       print the version
  --help          print this

It stays in the foreground, takes a listening socket from the service manager when it is given one,
and ends by itself after six minutes without anything to do. SIGTERM ends it in good order, SIGHUP
makes it read the logging preferences again. Its exit status is 0, and 2 for a wrong command line.
)";
}

}  // namespace zal
