#include "dump/disk_budget_keeper.h"

#include <algorithm>
#include <utility>

#include "platform/agent_log.h"
#include "platform/platform.h"
#include "platform/size_text.h"
#include "platform/standard_path.h"
#include "session/collected_files.h"
#include "session/date_text.h"

namespace zal {
namespace {

constexpr std::string_view kArchiveEnding = ".zip";

std::string reasonText(Eviction::Reason reason, const DiskLimits& limits) {
  switch (reason) {
    case Eviction::Reason::leftover:
      return "the agent that made it is gone";
    case Eviction::Reason::expired:
      return "it is more than a year old";
    case Eviction::Reason::overSize:
      return "more than " + sizeText(limits.most.value_or(0)) + " are kept";
    case Eviction::Reason::tooFull:
      return "less than " + sizeText(limits.keepFree) + " of the disk are free";
  }
  return "";
}

std::string nameOf(const KeptItem& item) {
  return std::string(keptKindText(item.kind)) + (item.type.empty() ? "" : " of " + printable(item.type));
}

void forget(std::vector<KeptItem>& items, const std::vector<bool>& gone) {
  std::vector<KeptItem> left;
  for (std::size_t i = 0; i < items.size(); ++i) {
    if (!gone[i]) left.push_back(std::move(items[i]));
  }
  items = std::move(left);
}

bool looksAtFailures(const std::vector<Eviction>& plan) {
  return std::any_of(plan.begin(), plan.end(), [](const Eviction& eviction) {
    return eviction.reason == Eviction::Reason::overSize || eviction.reason == Eviction::Reason::tooFull;
  });
}

}  // namespace

DiskBudgetKeeper::DiskBudgetKeeper(Platform& platform)
    : _settings(platform.configuration.disk),
      _home(platform.files.homeDirectory()),
      _store(platform.keptStore),
      _clock(platform.clock),
      _log(platform.agentLog),
      _queue(platform.queues.global(QueuePriority::background)) {}

void DiskBudgetKeeper::look() {
  {
    const std::scoped_lock lock(_mutex);
    if (std::exchange(_isAsked, true)) return;
  }
  _queue.async([this] { _lookNow(); });
}

void DiskBudgetKeeper::lookLater() {
  _queue.asyncAfter(kFirstLook, [this] { _lookNow(); });
}

bool DiskBudgetKeeper::admits(std::string_view type) {
  const DiskRoom room = _store.room();
  const DiskLimits limits = diskLimits(_settings, room);
  {
    const std::scoped_lock lock(_mutex);
    const auto largest = _largest.find(type);
    const std::uint64_t expected = expectedDump(largest != _largest.end() ? largest->second : 0, limits);
    if (!hasRoomFor(expected, limits, room, _use)) return false;
    if (hasRoomFor(expected, limits, room, {.bytes = _use.bytes})) return true;
    _reserve = std::max(_reserve, expected);
  }
  look();
  return true;
}

std::shared_ptr<void> DiskBudgetKeeper::hold(const std::string& directory) {
  std::string path = resolveAndStandardize(directory, _home);
  const std::scoped_lock lock(_held->mutex);
  _held->directories.insert(path);
  return {_held.get(), [held = _held, path = std::move(path)](Held*) {
            const std::scoped_lock release(held->mutex);
            held->directories.erase(held->directories.find(path));
          }};
}

void DiskBudgetKeeper::_lookNow() {
  const std::scoped_lock looking(_looking);
  std::uint64_t reserve = 0;
  {
    const std::scoped_lock lock(_mutex);
    _isAsked = false;
    reserve = std::exchange(_reserve, 0);
  }
  std::vector<KeptItem> items = _store.items();
  _markHeld(items);
  while (_evict(items, reserve)) {
  }
  _remember(items);
}

void DiskBudgetKeeper::_markHeld(std::vector<KeptItem>& items) {
  std::multiset<std::string> held;
  {
    const std::scoped_lock lock(_held->mutex);
    held = _held->directories;
  }
  if (held.empty()) return;
  for (KeptItem& item : items) {
    std::string path = resolveAndStandardize(item.path, _home);
    if (path.ends_with(kArchiveEnding) && !item.isDirectory) path.resize(path.size() - kArchiveEnding.size());
    if (held.contains(path)) item.inUse = "being collected";
  }
}

/// Returned: whether something that was to go is still there, so that others have to go in its place.
bool DiskBudgetKeeper::_evict(std::vector<KeptItem>& items, std::uint64_t reserve) {
  const DiskRoom room = _store.room();
  const DiskLimits limits = diskLimits(_settings, room);
  std::vector<Eviction> plan = planEvictions(items, limits, room, _clock.wallNow(), reserve);
  if (looksAtFailures(plan)) {
    _store.findFailed(items);
    plan = planEvictions(items, limits, room, _clock.wallNow(), reserve);
  }
  std::vector<bool> gone(items.size(), false);
  bool isBlocked = false;
  for (const Eviction& eviction : plan) {
    KeptItem& item = items[eviction.item];
    if (const std::error_code error = _store.remove(item)) {
      _tellFailure(item, error);
      item.inUse = error.message();
      isBlocked = true;
      break;
    }
    gone[eviction.item] = true;
    _tell(item, eviction.reason, limits);
  }
  forget(items, gone);
  return isBlocked;
}

void DiskBudgetKeeper::_tell(const KeptItem& item, Eviction::Reason reason, const DiskLimits& limits) {
  _log.notice("Evicted " + printable(item.path) + " (" + nameOf(item) + ", " + sizeText(item.bytes) +
              ", of " + sessionDateText(_clock.localTime(item.changed)) + "): " + reasonText(reason, limits));
}

void DiskBudgetKeeper::_tellFailure(const KeptItem& item, const std::error_code& error) {
  if (error == std::errc::device_or_resource_busy || !_stubborn.insert(item.path).second) return;
  _log.warning("Could not evict " + printable(item.path) + ": " + error.message());
}

void DiskBudgetKeeper::_remember(const std::vector<KeptItem>& items) {
  std::map<std::string, std::uint64_t, std::less<>> largest;
  for (const KeptItem& item : items) {
    if (item.kind == KeptKind::stub || item.type.empty()) continue;
    std::uint64_t& bytes = largest[item.type];
    bytes = std::max(bytes, item.bytes);
  }
  const DiskUse use = diskUse(items, _clock.wallNow());
  const std::scoped_lock lock(_mutex);
  _use = use;
  _largest = std::move(largest);
}

}  // namespace zal
