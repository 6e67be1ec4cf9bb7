#include "bench/bus/snapshot.h"

#include <cstdlib>
#include <vector>

#include "bench/archive/measured_run.h"
#include "bench/support/child_process.h"
#include "bench/support/statistics.h"
#include "bench/support/timing.h"
#include "collectors/cellular_snapshot.h"
#include "platform/linux/bus/bus_connection.h"
#include "platform/linux/bus/telephony/bus_telephony.h"
#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/loop/linux_run_loop.h"
#include "platform/linux/loop/linux_work_queues.h"
#include "platform/linux/loop/loop_descriptor_watcher.h"
#include "tests/support/fake_dump_services.h"
#include "tests/support/fake_services.h"

namespace zal::bench {

SnapshotSeconds measureSnapshots(const testing::PrivateBus& bus, unsigned rounds) {
  testing::RecordingAgentLog log;
  testing::FakePropertyListWriter unused;
  const Configuration configuration;
  LinuxClock clock;
  LinuxRunLoop loop;
  LinuxWorkQueues queues{loop, [](std::string_view) {}};
  LoopDescriptorWatcher descriptors{loop.context()};
  const BusHost host{.configuration = configuration,
                     .clock = clock,
                     .mainLoop = loop,
                     .queues = queues,
                     .log = log,
                     .descriptors = descriptors,
                     .systemBus = bus.address(),
                     .sessionBus = ""};
  BusConnection connection(host, host.systemBus, "system bus");
  BusTelephony telephony(host, connection);
  CellularSnapshot snapshot(telephony, unused, log);
  const std::string mmcli = findProgram("mmcli");
  setenv("DBUS_SYSTEM_BUS_ADDRESS", bus.address().c_str(), 1);

  std::vector<double> ours;
  std::vector<double> theirs;
  for (unsigned round = 0; round < rounds; ++round) {
    const Stopwatch watch;
    if (!snapshot.CopyCellularState().contains("operator-name")) return {};
    ours.push_back(watch.seconds());
    const RunFigures run = measureRun({mmcli, "-m", "any", "-J"}, "/");
    if (run.succeeded) theirs.push_back(run.seconds);
  }
  return {.ours = median(ours), .mmcli = theirs.size() == rounds ? median(theirs) : 0};
}

}  // namespace zal::bench
