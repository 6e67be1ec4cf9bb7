#include "platform/linux/config/configuration_loader.h"

#include <algorithm>
#include <utility>

#include <toml++/toml.h>

#include "platform/linux/config/configuration_keys.h"
#include "platform/linux/config/host_paths.h"
#include "platform/linux/config/text_file.h"
#include "platform/linux/config/toml_error.h"
#include "platform/linux/files/escaped_text.h"

namespace zal {
namespace {

/// Keys can be of any size and hold what no terminal should be shown.
constexpr std::size_t kLongestWarning = 400;

bool isKnownSection(std::string_view section) {
  const auto keys = configurationKeys();
  return std::any_of(keys.begin(), keys.end(), [&](const auto& key) { return key.section == section; });
}

/// Walks a parsed file and gives each value to its key.
class Reader {
 public:
  Reader(LoadedConfiguration& result, const std::string& home) : _result(result), _home(home) {}

  void readDocument(const toml::table& document) {
    for (auto&& [name, node] : document) {
      const std::string_view section = name.str();
      const toml::table* table = node.as_table();
      if (!isKnownSection(section)) {
        _warn(name.source().begin.line, table != nullptr ? "unknown section [" + std::string(section) + "]"
                                                         : "unknown key " + std::string(section));
      } else if (table == nullptr) {
        _warn(name.source().begin.line, std::string(section) + " must be a section");
      } else {
        _readSection(section, *table);
      }
    }
    // The table is walked by name; people read the file from the top.
    std::stable_sort(_warnings.begin(), _warnings.end(),
                     [](const auto& left, const auto& right) { return left.first < right.first; });
    for (const auto& [line, text] : _warnings) {
      _result.warnings.push_back(_result.file + ":" + std::to_string(line) + ": " + text);
    }
  }

 private:
  void _readSection(std::string_view section, const toml::table& table) {
    const auto keys = configurationKeys();
    for (auto&& [name, node] : table) {
      const std::string_view keyName = name.str();
      const auto key = std::find_if(keys.begin(), keys.end(), [&](const ConfigurationKey& candidate) {
        return candidate.section == section && candidate.name == keyName;
      });
      const std::string label = std::string(section) + "." + std::string(keyName);
      const bool isOpen = key == keys.end() && isOpenSection(section);
      if (key == keys.end() && !isOpen) {
        _warn(name.source().begin.line, "unknown key " + label);
        continue;
      }
      const std::string complaint = isOpen ? takeOpenKey(keyName, node, _result.configuration)
                                           : key->take(node, _home, _result.configuration);
      if (!complaint.empty()) _warn(name.source().begin.line, label + " " + complaint);
    }
  }

  void _warn(toml::source_index line, std::string_view text) {
    _warnings.emplace_back(line, escapedLine(cutAtCharacter(text, kLongestWarning)));
  }

  LoadedConfiguration& _result;
  const std::string& _home;
  std::vector<std::pair<toml::source_index, std::string>> _warnings;
};

void addCategories(std::string_view list, std::vector<std::string>& categories) {
  constexpr std::string_view kBlanks = " \t";
  while (!list.empty()) {
    const std::size_t comma = std::min(list.find(','), list.size());
    std::string_view name = list.substr(0, comma);
    list.remove_prefix(std::min(comma + 1, list.size()));
    name.remove_prefix(std::min(name.find_first_not_of(kBlanks), name.size()));
    name = name.substr(0, name.find_last_not_of(kBlanks) + 1);
    if (name.empty() || std::find(categories.begin(), categories.end(), name) != categories.end()) continue;
    categories.emplace_back(name);
  }
}

}  // namespace

LoadedConfiguration ConfigurationLoader::load() const {
  LoadedConfiguration result;
  result.configuration.roots = defaultDirectoryRoots(_environment);
  result.configuration.commands.toolDirectory = _environment.executableDirectory;
  _readFile(result);
  fillDependentRoots(result.configuration.roots);
  addCategories(_environment.variable("LIRRA_LOG_CATEGORIES"), result.configuration.log.categories);
  return result;
}

void ConfigurationLoader::_readFile(LoadedConfiguration& result) const {
  const auto file = configurationFile(_environment);
  if (!file) return;
  result.file = *file;
  std::string text;
  if (const std::error_code error = readTextFile(*file, text)) {
    result.warnings.push_back(*file + ":1: cannot be read: " + error.message());
    return;
  }
  try {
    Reader(result, _environment.homeDirectory).readDocument(toml::parse(text, *file));
  } catch (const toml::parse_error& error) {
    result.warnings.push_back(*file + ":" + lineAndReason(error));
  }
}

std::vector<std::string> ConfigurationLoader::knownKeys() {
  std::vector<std::string> names;
  for (const ConfigurationKey& key : configurationKeys()) {
    names.push_back(std::string(key.section) + "." + std::string(key.name));
  }
  return names;
}

}  // namespace zal
