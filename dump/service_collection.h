#pragma once

#include <functional>
#include <string>
#include <vector>

#include "dump/closing_stages.h"
#include "dump/wifi_dump.h"
#include "session/session_services.h"

namespace zal {

class Collectors;
class DiskBudgetKeeper;
struct Platform;

/// Gathers into one directory the logs that belong to one service, step by step as the flags say,
/// and hands over to the closing stages. Main thread only; the services are borrowed.
class ServiceCollection {
 public:
  struct Services {
    Platform& platform;
    Collectors& collectors;
    ClosingStages& closing;
    SignalWait wait = waitInSteadyTime;
    DiskBudgetKeeper* disk = nullptr;  ///< says whether there is room for the big steps
    /// What may take long happens on the standard queue, in the same order; else on the calling thread.
    bool usesQueues = false;
  };
  explicit ServiceCollection(const Services& services) : _services(services) {}

  /// Returns when the closing stages are queued, or their first one is done when the request is not
  /// for the background; with queues, and unless it is the last one, when the first steps are queued and the
  /// destination is there. The completion runs once, on the main thread, when the archive is made.
  /// Whether the destination may be written to is the caller's affair.
  void CollectServiceLogs(const CollectionRequest& request, std::function<void()> completion = {});

  /// All steps of such a request, the closing ones and those that are skipped too: the big ones, to save
  /// room, where they are asked for.
  [[nodiscard]] static std::vector<PlannedStep> plan(const CollectionRequest& request,
                                                     bool savesRoom = false);

 private:
  class Run;
  [[nodiscard]] std::function<void()> _coexistenceDump(const CollectionRequest& request);

  Services _services;
  // The manager is looked up at the first need and then remembered, present or not.
  bool _lookedUpCoexistence = false;
  std::function<void()> _coexistenceEntryPoint;
};

}  // namespace zal
