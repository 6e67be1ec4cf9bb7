#pragma once

#include "collectors/cellular_snapshot.h"
#include "collectors/command_runner.h"
#include "collectors/command_table.h"
#include "collectors/file_collector.h"
#include "collectors/gathering_witness.h"
#include "collectors/log_collectors.h"
#include "collectors/network_diagnostics.h"
#include "collectors/ping_runner.h"

namespace zal {

struct Platform;

/// All collectors of the process, each made once from the host's services, and the process's ping
/// runner named. Made on the main thread. The platform outlives it, and it outlives every session
/// and every dump.
class Collectors {
 public:
  explicit Collectors(Platform& platform);
  ~Collectors();
  Collectors(const Collectors&) = delete;
  Collectors& operator=(const Collectors&) = delete;

  GatheringWitnesses witnesses;
  CommandRunner commands;
  CommandTable table;
  FileCollector files;
  _ZalLoggingAgentPingRunner pings;
  CellularSnapshot cellular;
  NetworkDiagnostics network;
  LogCollectors logs;
};

}  // namespace zal
