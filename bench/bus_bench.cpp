// What an agent with a modem and a Wi-Fi on its bus costs, as "name value" lines; where they cannot be had,
// a line with the reason instead.
//
//     bus_bench PROGRAM_FOLDER ROUNDS SECONDS

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <stdexcept>
#include <string>

#include "bench/bus/longest_wait.h"
#include "bench/bus/session_cost.h"
#include "bench/bus/snapshot.h"
#include "tests/e2e/bus/played_wifi.h"

namespace {

void print(const std::string& name, const zal::bench::SessionCost& cost) {
  printf("%s_at_rest %.6f\n%s_in_session %.6f\n%s_cpu_an_hour %.6f\n", name.c_str(), cost.atRest,
         name.c_str(), cost.inSession, name.c_str(), cost.cpuSecondsAnHour);
}

int measure(const char* programs, unsigned rounds, double seconds) {
  using namespace zal;
  for (const std::string& obstacle : {testing::PrivateBus::obstacle(), testing::PlayedDaemon::obstacle(),
                                      testing::RealModemManager::obstacle()}) {
    if (obstacle.empty()) continue;
    printf("%s\n", obstacle.c_str());
    return 0;
  }
  testing::PrivateBus bus;
  testing::EmulatedModem modem({"csq=20"});
  testing::RealModemManager manager(bus, modem);
  const testing::PlayedWifi wifi(bus, {.strength = 70, .rssi = -58, .rate = 433});
  const bench::SnapshotSeconds snapshot = bench::measureSnapshots(bus, rounds);
  printf("snapshot %.9f\nmmcli %.9f\n", snapshot.ours, snapshot.mmcli);
  bench::IdleSession sampling(programs, bus.address());
  bench::IdleSession withoutBus(programs, "");
  print("bus", sampling.costAfter(seconds));
  print("no_bus", withoutBus.costAfter(seconds));
  const double stopped = std::min(seconds, 12.0);
  const bench::LongestWaits waits = bench::measureLongestWaits(programs, bus, manager, stopped);
  printf("wait_hung %.6f\nwait_hung_barriers %u\n", waits.whileModemDaemonHangs.seconds,
         waits.whileModemDaemonHangs.barriers);
  printf("wait_dead %.6f\nwait_dead_barriers %u\n", waits.whileBusIsDead.seconds,
         waits.whileBusIsDead.barriers);
  // Without one, nothing of this was the cost of a sample.
  return wifi.polls() > 0 ? 0 : 1;
}

}  // namespace

int main(int count, char** arguments) {
  if (count != 4) {
    fprintf(stderr, "usage: bus_bench PROGRAM_FOLDER ROUNDS SECONDS\n");
    return 2;
  }
  try {
    return measure(arguments[1], static_cast<unsigned>(atoi(arguments[2])), atof(arguments[3]));
  } catch (const std::exception& error) {
    fprintf(stderr, "bus_bench: %s\n", error.what());
    return 1;
  }
}
