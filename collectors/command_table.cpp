#include "collectors/command_table.h"

#include <algorithm>
#include <array>
#include <optional>

#include "collectors/command_rows.h"
#include "collectors/command_runner.h"
#include "collectors/single_quoted.h"
#include "platform/agent_log.h"
#include "platform/configuration.h"

namespace zal {
namespace {

using TextMember = std::string Endpoints::*;
struct NamedEndpoint {
  std::string_view name;
  TextMember host;
};
constexpr std::array kEndpoints = {
    NamedEndpoint{"makerWebHost", &Endpoints::makerWebHost},
    NamedEndpoint{"searchWebHost", &Endpoints::searchWebHost},
    NamedEndpoint{"farsite", &Endpoints::farsite},
    NamedEndpoint{"pushCourierHost1", &Endpoints::pushCourierHost1},
    NamedEndpoint{"pushCourierHost2", &Endpoints::pushCourierHost2},
    NamedEndpoint{"pushCourierHost6", &Endpoints::pushCourierHost6},
};

std::optional<std::string_view> placeholderValue(std::string_view name, const Configuration& configuration) {
  if (name == "wifi") return configuration.interfaces.wifi;
  if (name == "cellular") return configuration.interfaces.cellular;
  if (name == "SystemLogRoot") return configuration.roots.SystemLogRoot;
  if (name == "tools") return configuration.commands.toolDirectory;
  if (name == "reader") return configuration.commands.systemLogReader;
  for (const NamedEndpoint& endpoint : kEndpoints) {
    if (name == endpoint.name) return configuration.endpoints.*endpoint.host;
  }
  return std::nullopt;
}

bool isPlain(unsigned char c) {
  return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c >= 0x80 ||
         std::string_view("@%+=_:,./~-").find(static_cast<char>(c)) != std::string_view::npos;
}

// A host or a path is inserted as it is; only one that the shell would take apart gets quotes.
std::string shellWord(std::string_view value) {
  if (std::all_of(value.begin(), value.end(),
                  [](char c) { return isPlain(static_cast<unsigned char>(c)); })) {
    return std::string(value);
  }
  return singleQuoted(value);
}

std::string filledIn(std::string_view line, const Configuration& configuration) {
  std::string result;
  while (!line.empty()) {
    const std::size_t open = std::min(line.find('{'), line.size());
    const std::size_t close = line.find('}', open);
    // "${wifi}" is the shell's variable of that name.
    const bool isVariable = open > 0 && line[open - 1] == '$';
    std::optional<std::string_view> value;
    if (close != std::string_view::npos && !isVariable) {
      value = placeholderValue(line.substr(open + 1, close - open - 1), configuration);
    }
    if (value) {
      result.append(line.substr(0, open)).append(shellWord(*value));
      line.remove_prefix(close + 1);
    } else {
      const std::size_t taken = std::min(open + 1, line.size());
      result.append(line.substr(0, taken));
      line.remove_prefix(taken);
    }
  }
  return result;
}

bool names(std::string_view line, std::string_view placeholder) {
  return line.find(std::string("{").append(placeholder).append("}")) != std::string_view::npos;
}

std::string_view unconfiguredEndpoint(std::string_view line, const Endpoints& endpoints) {
  for (const NamedEndpoint& endpoint : kEndpoints) {
    if ((endpoints.*endpoint.host).empty() && names(line, endpoint.name)) return endpoint.name;
  }
  return {};
}

// Without their directory our own programs are nowhere; the literal line then says what is missing.
bool hasSubstitute(const CommandRow& row, const CommandSettings& settings) {
  if (settings.profile != CommandProfile::linux || row.linux.empty()) return false;
  const bool needsTools = names(row.linux, "tools") || names(row.linux, "reader");
  return !needsTools || !settings.toolDirectory.empty();
}

}  // namespace

CommandTable::CommandTable(const Configuration& configuration, AgentLog& log)
    : _configuration(configuration) {
  const std::vector<CommandRow> known = allRows();
  std::string unknown;
  for (const auto& [id, line] : configuration.commands.rows) {
    const auto isIt = [&wanted = id](const CommandRow& row) { return row.id == wanted; };
    if (std::any_of(known.begin(), known.end(), isIt)) continue;
    unknown += (unknown.empty() ? "" : ", ") + id;
  }
  if (!unknown.empty()) log.warning("[commands] names rows that do not exist: " + unknown);
}

std::span<const CommandRow> CommandTable::rows(CommandGroup group) {
  switch (group) {
    case CommandGroup::sessionCaptures:
      return command_rows::kSessionCaptures;
    case CommandGroup::networkConsole:
      return command_rows::kNetworkConsole;
    case CommandGroup::wifiFiles:
      return command_rows::kWifiFiles;
    case CommandGroup::networkPower:
      return command_rows::kNetworkPower;
    case CommandGroup::networkTables:
      return command_rows::kNetworkTables;
    case CommandGroup::networkNames:
      return command_rows::kNetworkNames;
    case CommandGroup::wifiRadio:
      return command_rows::kWifiRadio;
    case CommandGroup::networkMachine:
      return command_rows::kNetworkMachine;
    case CommandGroup::wifiProbe:
      return command_rows::kWifiProbe;
    case CommandGroup::networkRoutes:
      return command_rows::kNetworkRoutes;
    case CommandGroup::networkConsoleEnd:
      return command_rows::kNetworkConsoleEnd;
    case CommandGroup::handover:
      return command_rows::kHandover;
    case CommandGroup::sharing:
      return command_rows::kSharing;
    case CommandGroup::registration:
      return command_rows::kRegistration;
    case CommandGroup::systemLogs:
      return command_rows::kSystemLogs;
    case CommandGroup::bluetooth:
      return command_rows::kBluetooth;
    case CommandGroup::pushService:
      return command_rows::kPushService;
  }
  return {};
}

std::vector<CommandRow> CommandTable::allRows() {
  std::vector<CommandRow> all;
  for (int group = 0; group <= static_cast<int>(CommandGroup::pushService); ++group) {
    const auto some = rows(static_cast<CommandGroup>(group));
    all.insert(all.end(), some.begin(), some.end());
  }
  all.push_back(command_rows::kStopReaders);
  return all;
}

std::string CommandTable::commandLine(const CommandRow& row) const {
  const CommandSettings& settings = _configuration.commands;
  if (const auto own = settings.rows.find(std::string(row.id)); own != settings.rows.end()) {
    return filledIn(own->second, _configuration);
  }
  if (!hasSubstitute(row, settings)) return filledIn(row.literal, _configuration);
  const std::string_view missing = unconfiguredEndpoint(row.linux, _configuration.endpoints);
  if (missing.empty()) return filledIn(row.linux, _configuration);
  return "echo '" + std::string(missing) + " is not configured in [endpoints].'";
}

void CommandTable::runInBackground(CommandRunner& runner, CommandGroup group,
                                   std::string_view directory) const {
  for (const CommandRow& row : rows(group)) {
    runner.RunCommandInBackground(commandLine(row), directory, row.file);
  }
}

std::string CommandTable::stopReadersCommand() const { return commandLine(command_rows::kStopReaders); }

}  // namespace zal
