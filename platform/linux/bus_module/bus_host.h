#pragma once

#include <functional>
#include <string>
#include <string_view>

#include "platform/agent_log.h"
#include "platform/clock.h"
#include "platform/configuration.h"
#include "platform/linux/loop/descriptor_watcher.h"
#include "platform/run_loop.h"
#include "platform/work_queue.h"

namespace zal {

/// What the bus module is given of the agent. Borrowed: all of it outlives the module's services.
struct BusHost {
  const Configuration& configuration;
  Clock& clock;
  RunLoop& mainLoop;
  WorkQueues& queues;
  AgentLog& log;
  DescriptorWatcher& descriptors;
  std::string systemBus;   ///< D-Bus address; empty: this host has none
  std::string sessionBus;  ///< of the agent's own user; empty: there is none
  bool isSystem = false;   ///< an agent of the superuser, which has its name on the system bus
  /// Brings all that was logged into the files, before a request of the bus is answered.
  std::function<void()> flush = [] {};
  /// Starts the baseband dump's helper; any thread, returns at once.
  std::function<void(std::string_view reason)> startBasebandDump = [](std::string_view) {};
};

}  // namespace zal
