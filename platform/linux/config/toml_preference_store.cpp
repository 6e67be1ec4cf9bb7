#include "platform/linux/config/toml_preference_store.h"

#include <cerrno>
#include <system_error>
#include <utility>

#include <toml++/toml.h>

#include "platform/linux/config/preference_text.h"
#include "platform/linux/config/text_file.h"
#include "platform/linux/config/toml_error.h"

namespace zal {
namespace {

using Switches = std::map<std::string, bool, std::less<>>;

Switches switchesOf(const toml::table& document) {
  Switches switches;
  for (auto&& [key, node] : document) {
    if (const auto value = node.value_exact<bool>()) switches.emplace(key.str(), *value);
  }
  return switches;
}

}  // namespace

std::string TomlPreferenceStore::filePath(const std::string& directory, std::string_view domain) {
  return directory + "/" + std::string(domain) + ".toml";
}

void TomlPreferenceStore::synchronize(std::string_view domain) {
  _mainThread.check("TomlPreferenceStore");
  _synchronized(domain);
}

std::optional<bool> TomlPreferenceStore::boolean(std::string_view domain, std::string_view key) {
  _mainThread.check("TomlPreferenceStore");
  const auto known = _domains.find(domain);
  const Switches& switches =
      known == _domains.end() ? _synchronized(domain).switches : known->second.switches;
  const auto found = switches.find(key);
  if (found == switches.end()) return std::nullopt;
  return found->second;
}

TomlPreferenceStore::Domain& TomlPreferenceStore::_synchronized(std::string_view name) {
  Domain& domain = _domains[std::string(name)];
  const std::string path = filePath(_directory, name);
  const FileSignature signature = FileSignature::of(path);
  if (signature == domain.signature) return domain;
  std::string text;
  if (signature.error != ENOENT) {
    if (const std::error_code error = readTextFile(path, text)) {
      // Perhaps next time. A moment without descriptors must not switch off what is on.
      if (std::exchange(domain.trouble, error) != error)
        _log.warning(path + ":1: cannot be read: " + error.message());
      return domain;
    }
  }
  domain.signature = signature;
  domain.trouble.clear();
  domain.switches.clear();
  try {
    domain.switches = switchesOf(toml::parse(text, path));
  } catch (const toml::parse_error& error) {
    _log.warning(path + ":" + lineAndReason(error));
  }
  return domain;
}

std::optional<std::string> TomlPreferenceStore::setBoolean(const std::string& directory,
                                                           std::string_view domain, std::string_view key,
                                                           bool value) {
  const std::string path = filePath(directory, domain);
  std::string text;
  const std::error_code error = readTextFile(path, text);
  if (error && error != std::errc::no_such_file_or_directory) {
    return path + ": cannot be read: " + error.message();
  }
  std::string reason;
  const auto changed = withSwitch(text, key, value, reason);
  if (!changed) return path + ":" + reason;
  if (const std::error_code failure = replaceTextFile(path, *changed)) {
    return path + ": cannot be written: " + failure.message();
  }
  return std::nullopt;
}

}  // namespace zal
