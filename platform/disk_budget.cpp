#include "platform/disk_budget.h"

#include <algorithm>
#include <limits>
#include <map>
#include <tuple>

namespace zal {
namespace {

constexpr std::uint64_t kHundred = 100;
constexpr std::uint64_t kEndless = std::numeric_limits<std::uint64_t>::max();

std::uint64_t plus(std::uint64_t a, std::uint64_t b) { return a > kEndless - b ? kEndless : a + b; }
std::uint64_t minus(std::uint64_t a, std::uint64_t b) { return a > b ? a - b : 0; }
std::uint64_t percentOf(std::uint64_t whole, std::uint64_t percent) {
  return whole / kHundred * percent + whole % kHundred * percent / kHundred;
}

/// Records and temporary files are a type of their own, whatever sessions are called.
using TypeKey = std::pair<bool, std::string_view>;
TypeKey typeKeyOf(const KeptItem& item) {
  return {item.kind != KeptKind::record && item.kind != KeptKind::temporary, item.type};
}

struct TypeQueue {
  std::uint64_t bytes = 0;
  /// Indices of what may go, the oldest last: first what did not fail, then what did.
  std::vector<std::size_t> waiting[2];
};

class Planner {
 public:
  Planner(const std::vector<KeptItem>& items, WallTime now) : _items(items), _now(now) {}

  std::vector<Eviction> plan(const DiskLimits& limits, const DiskRoom& room, std::uint64_t reserve) {
    std::uint64_t bytes = 0, free = room.free;
    for (std::size_t i = 0; i < _items.size(); ++i) {
      const KeptItem& item = _items[i];
      if (_goesAnyway(item)) {
        const bool isLeftover = item.isLeftover;
        _plan.push_back({i, isLeftover ? Eviction::Reason::leftover : Eviction::Reason::expired});
        if (!item.isElsewhere) free = plus(free, item.bytes);
        continue;
      }
      bytes = plus(bytes, item.bytes);
      TypeQueue& type = _types[typeKeyOf(item)];
      type.bytes = plus(type.bytes, item.bytes);
      if (whyItStays(item, _now).empty()) type.waiting[item.hasFailed ? 1 : 0].push_back(i);
    }
    _overSize = limits.most ? minus(plus(bytes, reserve), *limits.most) : 0;
    _missing = room.total > 0 ? minus(plus(limits.keepFree, reserve), free) : 0;
    _share = minus(bytes, std::max(_overSize, _missing)) / std::max<std::size_t>(_types.size(), 1);
    for (auto& [key, type] : _types) {
      for (auto& waiting : type.waiting) _sort(waiting);
    }
    while ((_overSize > 0 || _missing > 0) && _evictNext()) {
    }
    return std::move(_plan);
  }

 private:
  [[nodiscard]] bool _goesAnyway(const KeptItem& item) const {
    if (!item.inUse.empty()) return false;
    return item.isLeftover || (item.kind == KeptKind::stub && _now - item.changed > kStubLife);
  }

  void _sort(std::vector<std::size_t>& waiting) const {
    std::sort(waiting.begin(), waiting.end(), [this](std::size_t a, std::size_t b) {
      return std::tie(_items[b].changed, _items[b].path) < std::tie(_items[a].changed, _items[a].path);
    });
  }

  /// What lies elsewhere does not make the disk any emptier.
  [[nodiscard]] bool _helps(const KeptItem& item) const {
    return item.bytes > 0 && (_overSize > 0 || !item.isElsewhere);
  }

  bool _evictNext() {
    TypeQueue* best = nullptr;
    int bestFailed = 0;
    for (auto& [key, type] : _types) {
      for (int failed = 0; failed < 2; ++failed) {
        auto& waiting = type.waiting[failed];
        while (!waiting.empty() && !_helps(_items[waiting.back()])) waiting.pop_back();
        if (waiting.empty()) continue;
        const auto rank = [this](const TypeQueue& of, int hasFailed) {
          return std::make_tuple(of.bytes <= _share, hasFailed, kEndless - of.bytes);
        };
        if (best == nullptr || rank(type, failed) < rank(*best, bestFailed)) {
          best = &type;
          bestFailed = failed;
        }
      }
    }
    if (best == nullptr) return false;
    const std::size_t index = best->waiting[bestFailed].back();
    best->waiting[bestFailed].pop_back();
    const KeptItem& item = _items[index];
    _plan.push_back({index, _overSize > 0 ? Eviction::Reason::overSize : Eviction::Reason::tooFull});
    best->bytes -= std::min(best->bytes, item.bytes);
    _overSize = minus(_overSize, item.bytes);
    if (!item.isElsewhere) _missing = minus(_missing, item.bytes);
    return true;
  }

  const std::vector<KeptItem>& _items;
  const WallTime _now;
  std::map<TypeKey, TypeQueue> _types;
  std::uint64_t _overSize = 0, _missing = 0, _share = 0;
  std::vector<Eviction> _plan;
};

}  // namespace

DiskLimits diskLimits(const DiskSettings& settings, const DiskRoom& room) {
  DiskLimits limits;
  if (settings.size > 0) limits.most = settings.size;
  if (room.total == 0) return limits;
  if (!limits.most && settings.share > 0) limits.most = percentOf(room.total, settings.share);
  limits.keepFree = percentOf(room.total, settings.keepFree);
  return limits;
}

std::string_view evictionReasonText(Eviction::Reason reason) {
  switch (reason) {
    case Eviction::Reason::leftover:
      return "leftover";
    case Eviction::Reason::expired:
      return "expired";
    case Eviction::Reason::overSize:
      return "over budget";
    case Eviction::Reason::tooFull:
      return "disk too full";
  }
  return "";
}

std::vector<Eviction> planEvictions(const std::vector<KeptItem>& items, const DiskLimits& limits,
                                    const DiskRoom& room, WallTime now, std::uint64_t reserve) {
  return Planner(items, now).plan(limits, room, reserve);
}

std::string_view whyItStays(const KeptItem& item, WallTime now) {
  if (!item.inUse.empty()) return item.inUse;
  if (item.kind == KeptKind::stub) return "all that is left of an archive";
  if (item.isDirectory && std::chrono::abs(now - item.changed) < kSettlingTime) return "changed just now";
  return {};
}

DiskUse diskUse(const std::vector<KeptItem>& items, WallTime now) {
  DiskUse use;
  for (const KeptItem& item : items) {
    use.bytes = plus(use.bytes, item.bytes);
    if (!item.isLeftover && !whyItStays(item, now).empty()) continue;
    use.mayGo = plus(use.mayGo, item.bytes);
    if (!item.isElsewhere) use.mayGoHere = plus(use.mayGoHere, item.bytes);
  }
  return use;
}

bool hasRoomFor(std::uint64_t bytes, const DiskLimits& limits, const DiskRoom& room, const DiskUse& use) {
  if (limits.most && plus(minus(use.bytes, use.mayGo), bytes) > *limits.most) return false;
  return room.total == 0 || plus(room.free, use.mayGoHere) >= plus(limits.keepFree, bytes);
}

std::uint64_t expectedDump(std::uint64_t largest, const DiskLimits& limits) {
  if (largest > 0) return plus(largest, largest);
  return limits.most ? std::min(kUnknownDump, *limits.most / 2) : kUnknownDump;
}

}  // namespace zal
