#include "session/arrival_order.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <utility>

#include "session/fetch_soon.h"

namespace zal {

namespace {

using Entries = std::vector<ZalPair<std::string_view, double>>;

// So many entries ahead are asked for that they are there when it is their turn.
constexpr std::size_t kEntriesAhead = 16;
constexpr unsigned kDigitBits = 11;
constexpr std::size_t kBuckets = std::size_t{1} << kDigitBits;
constexpr std::size_t kDigits = (64 + kDigitBits - 1) / kDigitBits;

struct Keyed {
  std::uint64_t key;
  std::uint64_t index;
};

// Bits that compare as integers the way the times compare as numbers.
std::uint64_t orderedBits(double time) {
  constexpr std::uint64_t kSign = std::uint64_t{1} << 63U;
  const auto bits = std::bit_cast<std::uint64_t>(time + 0.0);  // -0.0 equals 0.0
  return (bits & kSign) != 0 ? ~bits : bits | kSign;
}

std::size_t digitOf(std::uint64_t key, std::size_t digit) {
  return static_cast<std::size_t>(key >> (digit * kDigitBits)) & (kBuckets - 1);
}

// Stable, so that equal keys keep the order they came in.
void sortByKey(std::vector<Keyed>& keyed) {
  std::vector<std::array<std::size_t, kBuckets>> counts(kDigits);
  for (const Keyed& entry : keyed) {
    for (std::size_t digit = 0; digit < kDigits; ++digit) ++counts[digit][digitOf(entry.key, digit)];
  }
  std::vector<Keyed> sorted(keyed.size());
  for (std::size_t digit = 0; digit < kDigits; ++digit) {
    auto& starts = counts[digit];
    if (starts[digitOf(keyed.front().key, digit)] == keyed.size()) continue;  // all alike here
    std::size_t next = 0;
    for (std::size_t& start : starts) next += std::exchange(start, next);
    for (const Keyed& entry : keyed) sorted[starts[digitOf(entry.key, digit)]++] = entry;
    keyed.swap(sorted);
  }
}

// Each time at most the one before it.
bool isFalling(const Entries& entries) {
  return std::is_sorted(entries.begin(), entries.end(),
                        [](const auto& a, const auto& b) { return a.second > b.second; });
}

// The usual case, in one go: each time at least the one before it. Appends nothing and says false
// when that does not hold.
bool appendIfRising(const Entries& entries, std::vector<std::string_view>& texts) {
  const std::size_t before = texts.size();
  for (auto first = entries.begin(); first != entries.end();) {
    auto last = first + 1;
    while (last != entries.end() && last->second == first->second) ++last;
    if (last != entries.end() && last->second < first->second) {
      texts.resize(before);
      return false;
    }
    for (auto entry = last; entry != first;) texts.push_back((--entry)->first);
    first = last;
  }
  return true;
}

}  // namespace

void appendInTimeOrder(const Entries& entries, std::vector<std::string_view>& texts) {
  texts.reserve(texts.size() + entries.size());
  if (appendIfRising(entries, texts)) return;
  if (isFalling(entries)) {
    for (auto entry = entries.rbegin(); entry != entries.rend(); ++entry) texts.push_back(entry->first);
    return;
  }
  std::vector<Keyed> keyed;
  keyed.reserve(entries.size());
  for (std::size_t index = entries.size(); index-- > 0;) {  // latest first
    keyed.push_back({orderedBits(entries[index].second), index});
  }
  if (entries.size() < kBuckets) {
    std::stable_sort(keyed.begin(), keyed.end(),
                     [](const Keyed& a, const Keyed& b) { return a.key < b.key; });
  } else {
    sortByKey(keyed);
  }
  for (std::size_t place = 0; place < keyed.size(); ++place) {
    const std::size_t ahead = std::min(place + kEntriesAhead, keyed.size() - 1);
    fetchSoon(&entries[keyed[ahead].index]);
    texts.push_back(entries[keyed[place].index].first);
  }
}

}  // namespace zal
