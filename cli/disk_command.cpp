// disk: what the agent keeps, what it may keep, and what would go.

#include <algorithm>
#include <array>
#include <map>
#include <memory>
#include <utility>

#include "cli/printable_text.h"
#include "cli/table_text.h"
#include "cli/tool_context.h"
#include "platform/disk_budget.h"
#include "platform/json_text.h"
#include "platform/size_text.h"

namespace zal {
namespace {

constexpr std::size_t kNumberWidth = 7;
constexpr std::size_t kSizeWidth = 11;
constexpr std::array kKinds = {KeptKind::session, KeptKind::dump, KeptKind::stub, KeptKind::record,
                               KeptKind::temporary};

/// Some of what is kept.
struct Part {
  std::size_t items = 0;
  std::uint64_t bytes = 0;
  WallTime oldest = WallTime::max();

  void add(const KeptItem& item) {
    ++items;
    bytes += item.bytes;
    oldest = std::min(oldest, item.changed);
  }
};

/// What was looked at once, and what follows from it.
struct Survey {
  DiskRoom room;
  DiskLimits limits;
  std::vector<KeptItem> items;
  std::vector<Eviction> evictions;
  std::map<KeptKind, Part> kinds;
  std::map<std::string, Part> types;
  Part all;
  Part going;
  WallTime now{};
};

Survey survey(ToolContext& tool) {
  KeptStore& store = tool.host.kept();
  Survey result;
  result.now = tool.host.wallNow();
  result.room = store.room();
  result.limits = diskLimits(tool.host.settings().disk, result.room);
  result.items = store.items();
  store.findFailed(result.items);
  result.evictions = planEvictions(result.items, result.limits, result.room, result.now);
  for (const KeptItem& item : result.items) {
    result.all.add(item);
    result.kinds[item.kind].add(item);
    if (!item.type.empty()) result.types[item.type].add(item);
  }
  for (const Eviction& eviction : result.evictions) result.going.add(result.items[eviction.item]);
  return result;
}

std::string percentText(std::uint64_t part, std::uint64_t whole) {
  if (whole == 0) return "";
  return " (" +
         std::to_string(
             static_cast<int>(100.0 * static_cast<double>(part) / static_cast<double>(whole) + 0.5)) +
         " %)";
}

/// "12 items, 3.4 MiB"
std::string partText(const Part& part) {
  return std::to_string(part.items) + (part.items == 1 ? " item, " : " items, ") + sizeText(part.bytes);
}

class DiskPage {
 public:
  DiskPage(ToolContext& tool, const Survey& found) : _tool(tool), _found(found) {}

  void show() {
    _showRoom();
    _out() << "\n";
    _heading(_row("KIND", "ITEMS", "SIZE", ""));
    for (const KeptKind kind : kKinds) {
      const auto part = _found.kinds.find(kind);
      if (part != _found.kinds.end()) _showPart(std::string(keptKindText(kind)), part->second);
    }
    if (_found.kinds.empty()) _out() << "nothing is kept\n";
    if (!_found.types.empty()) _showTypes();
    _out() << "\n";
    if (_found.evictions.empty()) {
      _out() << "Nothing would go now.\n";
    } else {
      _out() << partText(_found.going) << " would go now; --simulate shows which.\n";
    }
  }

  void simulate() {
    if (_found.evictions.empty()) {
      _out() << "Nothing would go now.\n";
    } else {
      _heading("These would go, in this order:");
      std::size_t number = 0;
      for (const Eviction& eviction : _found.evictions) {
        const KeptItem& item = _found.items[eviction.item];
        _out() << padded(std::to_string(++number), 4, true) << "  "
               << padded(std::string(evictionReasonText(eviction.reason)), 13) << "  " << _lineOf(item)
               << "\n";
      }
      const std::uint64_t left = _found.all.bytes - std::min(_found.all.bytes, _found.going.bytes);
      _out() << partText(_found.going) << "; " << sizeText(left) << " would be left.\n";
    }
    _showStaying();
  }

 private:
  [[nodiscard]] std::ostream& _out() const { return _tool.out; }

  void _heading(const std::string& text) const {
    const bool colour = _tool.host.wantsColour();
    _out() << (colour ? "\x1b[1m" : "") << text << (colour ? "\x1b[0m" : "") << "\n";
  }

  void _showRoom() const {
    const DiskLimits& limits = _found.limits;
    _out() << padded("kept", 8) << sizeText(_found.all.bytes);
    if (limits.most) {
      _out() << " of " << sizeText(*limits.most) << percentText(_found.all.bytes, *limits.most);
    } else {
      _out() << "; no limit";
    }
    _out() << "\n" << padded("free", 8);
    if (_found.room.total == 0) {
      _out() << "cannot be told";
    } else {
      _out() << sizeText(_found.room.free) << " of " << sizeText(_found.room.total)
             << percentText(_found.room.free, _found.room.total);
      if (limits.keepFree > 0) _out() << "; " << sizeText(limits.keepFree) << " shall stay free";
    }
    _out() << "\n"
           << padded("in", 8) << printableLine(_tool.host.settings().roots.DiagnosticReportRoot) << "\n";
  }

  [[nodiscard]] std::string _row(const std::string& name, const std::string& items, const std::string& size,
                                 const std::string& oldest) const {
    std::string row =
        padded(name, _nameWidth()) + padded(items, kNumberWidth, true) + padded(size, kSizeWidth, true);
    return oldest.empty() ? row : row + "  " + oldest;
  }

  [[nodiscard]] std::size_t _nameWidth() const {
    std::size_t width = keptKindText(KeptKind::temporary).size();
    for (const auto& [type, part] : _found.types) width = std::max(width, printableLine(type).size());
    return width;
  }

  void _showPart(const std::string& name, const Part& part) const {
    _out() << _row(printableLine(name), std::to_string(part.items), sizeText(part.bytes),
                   _tool.host.timeText(part.oldest))
           << "\n";
  }

  /// The one that takes the most first: it is asked first, too.
  void _showTypes() const {
    std::vector<std::pair<std::string, Part>> types(_found.types.begin(), _found.types.end());
    std::stable_sort(types.begin(), types.end(),
                     [](const auto& a, const auto& b) { return b.second.bytes < a.second.bytes; });
    _out() << "\n";
    _heading(_row("TYPE", "ITEMS", "SIZE", "OLDEST"));
    for (const auto& [type, part] : types) _showPart(type, part);
  }

  [[nodiscard]] std::string _lineOf(const KeptItem& item) const {
    return padded(sizeText(item.bytes), kSizeWidth, true) + "  " + _tool.host.timeText(item.changed) + "  " +
           printableLine(item.path) + (item.hasFailed ? "  (a failed call)" : "");
  }

  void _showStaying() const {
    bool isFirst = true;
    for (const KeptItem& item : _found.items) {
      if (item.inUse.empty()) continue;
      if (std::exchange(isFirst, false)) {
        _out() << "\n";
        _heading("These stay in any case:");
      }
      _out() << _lineOf(item) << "  (" << item.inUse << ")\n";
    }
  }

  ToolContext& _tool;
  const Survey& _found;
};

JsonObject partJson(const char* key, const std::string& name, const Part& part) {
  JsonObject object;
  object.add(key, name).add("items", std::uint64_t{part.items}).add("bytes", part.bytes);
  return object;
}

JsonObject itemJson(const KeptItem& item) {
  JsonObject object;
  object.add("path", item.path)
      .add("kind", keptKindText(item.kind))
      .add("type", item.type)
      .add("bytes", item.bytes);
  object.add("changed",
             std::int64_t{std::chrono::floor<std::chrono::seconds>(item.changed).time_since_epoch().count()});
  object.add("failed", item.hasFailed);
  return object;
}

void printJson(ToolContext& tool, const Survey& found, bool simulates) {
  std::vector<std::string> kinds, types, evictions, staying;
  for (const auto& [kind, part] : found.kinds)
    kinds.push_back(partJson("kind", std::string(keptKindText(kind)), part).text());
  for (const auto& [type, part] : found.types) types.push_back(partJson("type", type, part).text());
  JsonObject object;
  object.add("kept", found.all.bytes);
  if (found.limits.most) object.add("most", *found.limits.most);
  object.add("free", found.room.free)
      .add("total", found.room.total)
      .add("keepFree", found.limits.keepFree)
      .addJson("kinds", jsonArray(kinds))
      .addJson("types", jsonArray(types))
      .addJson(
          "goes",
          JsonObject().add("items", std::uint64_t{found.going.items}).add("bytes", found.going.bytes).text());
  if (simulates) {
    for (const Eviction& eviction : found.evictions) {
      evictions.push_back(
          itemJson(found.items[eviction.item]).add("reason", evictionReasonText(eviction.reason)).text());
    }
    for (const KeptItem& item : found.items) {
      if (!item.inUse.empty()) staying.push_back(itemJson(item).add("why", item.inUse).text());
    }
    object.addJson("evictions", jsonArray(evictions)).addJson("staying", jsonArray(staying));
  }
  tool.out << object.text() << "\n";
}

ExitCode disk(ToolContext& tool, bool simulates) {
  const Survey found = survey(tool);
  if (tool.options.json) {
    printJson(tool, found, simulates);
  } else if (simulates) {
    DiskPage(tool, found).simulate();
  } else {
    DiskPage(tool, found).show();
  }
  return ExitCode::done;
}

}  // namespace

void addDiskCommand(CLI::App& app, ToolContext& tool) {
  const auto simulates = std::make_shared<bool>(false);
  CLI::App* const command =
      app.add_subcommand("disk", "What the agent keeps on the disk, what it may keep, and what would go");
  command->group("The agent");
  command->footer(
      "Looks by itself, whether an agent runs or not, and removes nothing.\n"
      "Examples:\n  lirractl disk\n  lirractl disk --simulate");
  command->add_flag("--simulate", *simulates,
                    "What would go now, in order and why, and what stays in any case");
  tool.onCommand(*command, [&tool, simulates] { return disk(tool, *simulates); });
}

}  // namespace zal
