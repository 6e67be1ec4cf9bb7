// Sorted insertion and the end of a long session, medians of some rounds, as "name seconds" lines.
//
//     list_bench FOLDER ENTRIES ROUNDS

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <string>
#include <vector>

#include "bench/lists/session_end.h"
#include "bench/lists/timed_entries.h"
#include "bench/support/fresh_process.h"
#include "bench/support/statistics.h"

int main(int count, char** arguments) {
  using namespace zal::bench;
  if (count != 4) {
    fprintf(stderr, "usage: list_bench FOLDER ENTRIES ROUNDS\n");
    return 2;
  }
  const std::uint64_t entries = strtoull(arguments[2], nullptr, 10);
  const unsigned long rounds = strtoul(arguments[3], nullptr, 10);
  const std::vector<ArrivalOrder> orders = arrivalOrders(entries);
  std::map<std::string, std::vector<double>> seconds;
  for (unsigned long round = 0; round < rounds; ++round) {
    for (const ArrivalOrder& order : orders) {
      const std::string name(order.name);
      seconds[name].push_back(
          inFreshProcess([&] { return std::vector{secondsOfSortedList(order.times)}; }).front());
      seconds["multimap_" + name].push_back(
          inFreshProcess([&] { return std::vector{secondsOfMultimap(order.times)}; }).front());
    }
    for (const ArrivalOrder& order : orders) {
      if (order.name != "ascending" && order.name != "random") continue;
      const std::vector<double> end = inFreshProcess([&] {
        const SessionEndSeconds measured = measureSessionEnd(arguments[1], order.times);
        return std::vector{measured.end, measured.plainWrite};
      });
      seconds["session_end_" + std::string(order.name)].push_back(end.front());
      seconds["plain_write_" + std::string(order.name)].push_back(end.back());
    }
  }
  double worst = 0;
  double worstOfMultimap = 0;
  for (const ArrivalOrder& order : orders) {
    worst = std::max(worst, median(seconds[std::string(order.name)]));
    worstOfMultimap = std::max(worstOfMultimap, median(seconds["multimap_" + std::string(order.name)]));
  }
  for (const auto& [name, values] : seconds) printf("%s %.9f\n", name.c_str(), median(values));
  printf("worst %.9f\nmultimap_worst %.9f\n", worst, worstOfMultimap);
  return 0;
}
