#include "bench/lists/timed_entries.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <random>
#include <string>

#include "bench/support/timing.h"
#include "session/sorted_log_list.h"

namespace zal::bench {
namespace {

constexpr double kFirstTime = 1'714'651'387.251;
constexpr std::size_t kTextLength = 100;

std::string textOf(std::size_t number) {
  std::string text = std::to_string(number) + " ";
  text.resize(kTextLength, '.');
  return text;
}

// The text tells which time it came with.
void checkOrder(const std::vector<std::string_view>& lines, const std::vector<double>& times) {
  double previous = 0;
  for (const std::string_view line : lines) {
    const double time = times[std::stoul(std::string(line.substr(0, 10)))];
    if (lines.size() != times.size() || time < previous) {
      fprintf(stderr, "entries came out in the wrong order\n");
      exit(1);
    }
    previous = time;
  }
}

// Both take the same texts: a fresh number in a line of constant length, made outside of the list.
template <typename Add, typename Copy>
double secondsOf(const std::vector<double>& times, Add add, Copy copy) {
  std::string text = textOf(0);
  const Stopwatch watch;
  for (std::size_t index = 0; index < times.size(); ++index) {
    snprintf(text.data(), text.size(), "%09zu", index);
    text[9] = ' ';
    add(text, times[index]);
  }
  const auto lines = copy();
  const double seconds = watch.seconds();
  checkOrder(lines, times);
  return seconds;
}

}  // namespace

std::vector<ArrivalOrder> arrivalOrders(std::uint64_t entries) {
  std::vector<double> rising(entries);
  for (std::uint64_t index = 0; index < entries; ++index) {
    rising[index] = kFirstTime + static_cast<double>(index) * 0.001;
  }
  const std::vector<double> falling(rising.rbegin(), rising.rend());
  std::vector<double> random = rising;
  std::shuffle(random.begin(), random.end(), std::mt19937_64(20240502));
  std::vector<double> bothEnds;
  for (std::uint64_t index = 0; index < entries; ++index) {
    bothEnds.push_back(index % 2 == 0 ? rising[index / 2] : falling[index / 2]);
  }
  return {{"ascending", rising},
          {"descending", falling},
          {"random", random},
          {"zigzag", bothEnds},
          {"equal", std::vector<double>(entries, kFirstTime)}};
}

double secondsOfSortedList(const std::vector<double>& times) {
  _ZalLoggingAgentSessionSortedLogList list;
  LogLines kept;
  return secondsOf(
      times, [&](std::string_view text, double time) { list.addLog(text, time); },
      [&] {
        kept = list.copySortedLogList();
        return kept.lines;
      });
}

double secondsOfMultimap(const std::vector<double>& times) {
  std::multimap<double, std::string> map;
  return secondsOf(
      times, [&](std::string_view text, double time) { map.emplace(time, text); },
      [&] {
        std::vector<std::string_view> lines;
        lines.reserve(map.size());
        for (const auto& entry : map) lines.push_back(entry.second);
        return lines;
      });
}

}  // namespace zal::bench
