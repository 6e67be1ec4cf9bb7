#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/configuration.h"
#include "platform/kept_item.h"

namespace zal {

// How much of the disk the agent may keep for later, and what goes when it is more. Plain values in, plain
// values out; nothing here touches a disk.

/// What is left of an evicted archive goes after this long.
inline constexpr std::chrono::hours kStubLife{365 * 24};
/// A directory that changed so lately is still being written.
inline constexpr std::chrono::minutes kSettlingTime{10};
/// What a dump of a type that there was none of is expected to take.
inline constexpr std::uint64_t kUnknownDump = 8ULL << 20U;

struct DiskLimits {
  std::optional<std::uint64_t> most;  ///< bytes of all items; nothing: no such limit
  std::uint64_t keepFree = 0;         ///< bytes of the file system
};
/// Of a room that cannot be told, no limits.
[[nodiscard]] DiskLimits diskLimits(const DiskSettings& settings, const DiskRoom& room);

struct Eviction {
  enum class Reason {
    leftover,  ///< of no use; goes whatever the budget
    expired,   ///< a stub whose year is over; the same
    overSize,  ///< all items take more than they may
    tooFull,   ///< the file system has less free than it shall have
  };
  std::size_t item = 0;  ///< index
  Reason reason = Reason::overSize;
};
/// "leftover", "expired", "over budget", "disk too full".
[[nodiscard]] std::string_view evictionReasonText(Eviction::Reason reason);

/// What goes, in order. First what is of no use. Then, until the limits hold with `reserve` bytes more than
/// there are now: from the types that take more than their equal share of what may be kept, the one that
/// takes the most first, its oldest item that did not fail; then their failed ones; then the same of the
/// others. What is in use, a directory that is still being written, and a stub stay. Ties go by path.
[[nodiscard]] std::vector<Eviction> planEvictions(const std::vector<KeptItem>& items,
                                                  const DiskLimits& limits, const DiskRoom& room,
                                                  WallTime now, std::uint64_t reserve = 0);

/// Why the item must stay now; empty when it may go.
[[nodiscard]] std::string_view whyItStays(const KeptItem& item, WallTime now);

/// Sums that tell whether there is room for one more.
struct DiskUse {
  std::uint64_t bytes = 0;      ///< of all items
  std::uint64_t mayGo = 0;      ///< of those that may go
  std::uint64_t mayGoHere = 0;  ///< of these, on the file system of the reports
};
[[nodiscard]] DiskUse diskUse(const std::vector<KeptItem>& items, WallTime now);
/// Whether that many bytes more keep the limits once everything has gone that may go.
[[nodiscard]] bool hasRoomFor(std::uint64_t bytes, const DiskLimits& limits, const DiskRoom& room,
                              const DiskUse& use);
/// What a dump is expected to take while it is made, from the largest one of its type: twice that, for its
/// directory and its archive. Of a type without any (0), kUnknownDump or half of all that may be kept.
[[nodiscard]] std::uint64_t expectedDump(std::uint64_t largest, const DiskLimits& limits);

}  // namespace zal
