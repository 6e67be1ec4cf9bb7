#include "cli/archive_verdict.h"

#include <algorithm>
#include <map>
#include <optional>
#include <set>
#include <string_view>

#include <nlohmann/json.hpp>

namespace zal {
namespace {

using Json = nlohmann::json;
using Finding = ArchiveVerdict::Finding;

constexpr std::string_view kManifest = "Manifest.json";
constexpr std::size_t kMostSourcesNamed = 3;
/// Why a step was skipped that was asked for.
constexpr std::string_view kOverBudget = "over budget";

/// "Manifest.json", "Manifest.json-2" …
bool isManifestName(std::string_view name) {
  if (!name.starts_with(kManifest)) return false;
  name.remove_prefix(kManifest.size());
  if (name.empty()) return true;
  return name.size() > 1 && name[0] == '-' &&
         name.find_first_not_of("0123456789", 1) == std::string_view::npos;
}

bool leadsOut(std::string_view name) {
  if (name.empty() || name.front() == '/' || name.find('\0') != std::string_view::npos) return true;
  while (!name.empty()) {
    const std::size_t end = std::min(name.find('/'), name.size());
    if (name.substr(0, end) == "..") return true;
    name.remove_prefix(std::min(end + 1, name.size()));
  }
  return false;
}

std::string textOf(const Json& row, const char* key) {
  const auto found = row.find(key);
  return found != row.end() && found->is_string() ? found->get<std::string>() : "";
}

const Json& rowsOf(const Json& manifest, const char* key) {
  const Json& rows = manifest.at(key);
  if (!rows.is_array()) throw std::invalid_argument(std::string(key) + " is no list");
  for (const Json& row : rows) {
    if (!row.is_object()) throw std::invalid_argument(std::string("a row of ") + key + " is none");
  }
  return rows;
}

std::string reasonOf(const Json& step) {
  std::string reason;
  const auto why = step.find("why");
  if (why == step.end() || !why->is_array()) return reason;
  for (const Json& text : *why) {
    if (text.is_string()) reason.append(reason.empty() ? "" : "; ").append(text.get<std::string>());
  }
  return reason;
}

class Judge {
 public:
  explicit Judge(const ArchiveInspection& archive) : _archive(archive) {}

  ArchiveVerdict verdict() {
    if (!_archive.trouble.empty()) _damaged("the archive", _archive.trouble);
    const auto manifest = _manifest();
    _judgeEntries(manifest.has_value());
    if (manifest) {
      try {
        _readHead(*manifest);
        _readSteps(*manifest);
        _readCommands(*manifest);
        _readSources(*manifest);
        _readFiles(*manifest);
      } catch (const std::exception& error) {
        _damaged(std::string(kManifest), std::string("cannot be understood: ") + error.what());
      }
    }
    return std::move(_verdict);
  }

 private:
  void _damaged(std::string what, std::string why) {
    _verdict.damaged.push_back({std::move(what), std::move(why)});
  }
  void _missing(std::string what, std::string why) {
    _verdict.missing.push_back({std::move(what), std::move(why)});
  }

  std::optional<Json> _manifest() {
    if (_archive.entries.empty()) return std::nullopt;
    const std::string& name = _archive.entries.back().name;
    const std::size_t slash = name.find('/');
    if (slash == std::string::npos || !isManifestName(std::string_view(name).substr(slash + 1))) {
      return std::nullopt;
    }
    _top = name.substr(0, slash + 1);
    _verdict.hasManifest = true;
    if (!_archive.lastText) {
      // A damaged one is told as an entry.
      if (_archive.entries.back().trouble.empty()) _damaged(name, "is too long to be one");
      return std::nullopt;
    }
    Json manifest = Json::parse(*_archive.lastText, nullptr, false);
    if (!manifest.is_object()) {
      _damaged(name, "is no JSON object");
      return std::nullopt;
    }
    return manifest;
  }

  void _judgeEntries(bool isAccountable) {
    std::set<std::string_view> names;
    for (std::size_t i = 0; i < _archive.entries.size(); ++i) {
      const InspectedEntry& entry = _archive.entries[i];
      if (!entry.trouble.empty()) _damaged(entry.name, entry.trouble);
      if (!names.insert(entry.name).second) _damaged(entry.name, "stands in the archive twice");
      if (leadsOut(entry.name)) _damaged(entry.name, "has a name that leads out of a directory");
      if (entry.name.ends_with('/')) continue;
      if (_verdict.hasManifest && i + 1 == _archive.entries.size()) continue;
      if (entry.trouble.empty()) {
        ++_verdict.files;
        _verdict.bytes += entry.bytes;
      }
      if (isAccountable && !entry.name.starts_with(_top)) {
        _damaged(entry.name, "does not lie below " + _top);
      } else if (isAccountable) {
        _unaccounted.emplace(entry.name.substr(_top.size()), &entry);
      }
    }
  }

  void _readHead(const Json& manifest) {
    _verdict.service = textOf(manifest, "service");
    _verdict.flags = textOf(manifest, "flags");
    _verdict.began = textOf(manifest, "began");
    _verdict.archived = textOf(manifest, "archived");
  }

  void _readSteps(const Json& manifest) {
    std::map<std::string, std::vector<std::string>> absent;
    for (const Json& source : rowsOf(manifest, "sources")) {
      if (textOf(source, "state") == "missing")
        absent[textOf(source, "step")].push_back(textOf(source, "source"));
    }
    for (const Json& step : rowsOf(manifest, "steps")) {
      const std::string name = textOf(step, "step"), state = textOf(step, "state");
      std::string why = reasonOf(step);
      if (state == "skipped" && why == kOverBudget) {
        _missing(name, why);
      } else if (state == "skipped") {
        _verdict.skipped.push_back(name);
      } else if (state == "partial") {
        if (!why.empty()) _missing(name, why);  // its parts have rows of their own
      } else if (state != "done") {
        if (why.empty()) why = state;
        if (state == "missing") why += _named(absent[name]);
        _missing(name, why);
      }
    }
  }

  static std::string _named(const std::vector<std::string>& sources) {
    std::string text;
    for (std::size_t i = 0; i < std::min(sources.size(), kMostSourcesNamed); ++i)
      text.append(i == 0 ? ": " : ", ").append(sources[i]);
    return text + (sources.size() > kMostSourcesNamed ? " …" : "");
  }

  void _readCommands(const Json& manifest) {
    for (const Json& command : rowsOf(manifest, "commands")) {
      const std::string state = textOf(command, "state");
      if (state == "done") continue;
      const std::string file = textOf(command, "file"), why = textOf(command, "why");
      _missing(file.empty() ? textOf(command, "command") : file, why.empty() ? state : why);
    }
  }

  void _readSources(const Json& manifest) {
    for (const Json& source : rowsOf(manifest, "sources")) {
      if (textOf(source, "state") == "failed") _missing(textOf(source, "source"), textOf(source, "why"));
    }
    const Json& remarks = manifest.at("remarks");
    for (const Json& remark : remarks) {
      if (remark.is_string()) _missing("", remark.get<std::string>());
    }
  }

  void _readFiles(const Json& manifest) {
    for (const Json& row : rowsOf(manifest, "files")) {
      const std::string name = textOf(row, "file");
      const auto found = _unaccounted.find(name);
      if (found == _unaccounted.end()) {
        _damaged(name, "is in the manifest, but not in the archive");
        continue;
      }
      const InspectedEntry& entry = *found->second;
      _unaccounted.erase(found);
      if (!entry.trouble.empty()) continue;
      const auto bytes = row.find("bytes");
      if (bytes == row.end() || !bytes->is_number_unsigned() || bytes->get<std::uint64_t>() != entry.bytes) {
        _damaged(name, "has another length than the manifest says");
      } else if (textOf(row, "sha256") != entry.sha256) {
        _damaged(name, "has another SHA-256 than the manifest says");
      }
    }
    for (const auto& [name, entry] : _unaccounted)
      _damaged(name, "is in the archive, but not in the manifest");
  }

  const ArchiveInspection& _archive;
  ArchiveVerdict _verdict;
  std::string _top;  // with its slash; of the manifest
  std::map<std::string, const InspectedEntry*, std::less<>> _unaccounted;
};

}  // namespace

ArchiveVerdict judgeArchive(const ArchiveInspection& archive) { return Judge(archive).verdict(); }

}  // namespace zal
