#pragma once

#include "dump/action_dispatcher.h"
#include "dump/closing_stages.h"
#include "dump/disk_budget_keeper.h"
#include "dump/log_compressor.h"
#include "dump/log_dump.h"
#include "dump/service_collection.h"

namespace zal {

/// All that actions and collections are made of, each made once. Made on the main thread; the
/// platform, the collectors and the session's services outlive it, and it outlives every dump.
class Diagnostics {
 public:
  Diagnostics(Platform& platform, Collectors& collectors, const SessionServices& session);
  ~Diagnostics();
  Diagnostics(const Diagnostics&) = delete;
  Diagnostics& operator=(const Diagnostics&) = delete;

 private:
  _LirraLogCompressor::Services _compressorServices;

 public:
  _LirraLogCompressor& compressor;
  DiskBudgetKeeper disk;
  ClosingStages closing;
  ServiceCollection collection;
  LogDump logDump;
  ActionDispatcher dispatcher;
};

}  // namespace zal
