#include "dump/service_collection.h"

#include <memory>
#include <string>
#include <string_view>
#include <utility>

#include "collectors/collectors.h"
#include "dump/collection_steps.h"
#include "dump/disk_budget_keeper.h"
#include "dump/guarded_step.h"
#include "dump/planned_steps.h"
#include "platform/platform.h"
#include "session/collected_files.h"

namespace zal {

/// One collection's way through its steps, in their order, to the closing stages. Each job that waits for the
/// next one holds it.
class ServiceCollection::Run : public std::enable_shared_from_this<Run> {
 public:
  Run(const Services& services, CollectionRequest request, std::function<void()> dumpCoexistence,
      std::function<void()> completion)
      : _services(services),
        _request(std::move(request)),
        _savesRoom(services.disk != nullptr && !services.disk->admits(_request.service)),
        _held(services.disk != nullptr ? services.disk->hold(_request.destination) : nullptr),
        _startTime(services.platform.clock.wallNow()),
        _record(beginRecord(services.platform, services.collectors.witnesses,
                            {.service = _request.service,
                             .directory = _request.destination,
                             .flags = _request.flags,
                             .steps = plan(_request, _savesRoom)})),
        _at{services.platform,
            services.collectors,
            _request,
            *_record,
            services.wait,
            std::move(dumpCoexistence),
            services.collectors.network.wantsPings((_request.flags & kCollectPings) != 0)},
        _completion(std::move(completion)) {}

  [[nodiscard]] bool savesRoom() const { return _savesRoom; }

  /// On the main thread.
  void start() {
    // Who asked may want to add something.
    if (_leavesMainThread()) _at.makeDestination();
    _goOn();
  }

 private:
  [[nodiscard]] bool _leavesMainThread() const { return _services.usesQueues && !_request.isLast; }
  [[nodiscard]] WorkQueues& _queues() { return _services.platform.queues; }
  [[nodiscard]] NetworkDiagnostics& _network() { return _services.collectors.network; }

  /// The next step that is wanted; null when there is none.
  const CollectionStep* _next() {
    const auto steps = collectionSteps();
    while (_index < steps.size() && !steps[_index].isWanted(_request, _savesRoom)) ++_index;
    return _index < steps.size() ? &steps[_index] : nullptr;
  }

  void _goOn() {
    while (const CollectionStep* const step = _next()) {
      if (_leavesMainThread() && step->isForMain != _isOnMain) return _goOnElsewhere();
      if (step->stopsCaptures && !std::exchange(_areCapturesStopped, true)) {
        if (_leavesMainThread()) return _network().stopCapturesThen(_onStandardQueue());
        _network().StopCaptures();
      }
      _take(*step);
    }
    _close();
  }

  void _goOnElsewhere() {
    _isOnMain = !_isOnMain;
    if (!_isOnMain) return _onStandardQueue()();
    _queues().main().async([self = shared_from_this()] { self->_goOn(); });
  }

  std::function<void()> _onStandardQueue() {
    return [self = shared_from_this()] {
      self->_queues().global(QueuePriority::standard).async([self] { self->_goOn(); });
    };
  }

  void _take(const CollectionStep& step) {
    ++_index;
    _record->step(++_number);
    runGuarded(step.name, *_record, _services.platform.agentLog, [&] { step.run(_at); });
  }

  void _close() {
    makeClosingDirectories(_at);
    ClosingWork work{.service = _request.service,
                     .destination = _request.destination,
                     .pushLogs = _at.in("Push Logs"),
                     .networkStack = _at.in("Webstrand"),
                     .systemLogs = _at.in("System Logs"),
                     .basebandLogs = _at.in("Baseband Logs"),
                     .snapshots = _at.in("Snapshots"),
                     .packetCaptures = _at.in("TCPDump"),
                     .power = _at.in("Power"),
                     .reason = _request.reason,
                     .flags = _request.flags,
                     .savesRoom = _savesRoom,
                     .held = _held,
                     .startTime = _startTime,
                     .record = _record,
                     .firstStep = _number + 1,
                     .completion = std::move(_completion)};
    if (!_request.background && !_leavesMainThread()) {
      _network().StopCaptures();
      return _services.closing.run(std::move(work));
    }
    // Handed on and never left behind: with the completion goes a client's connection, which is the main
    // thread's.
    auto closeElsewhere = [&services = _services, work = std::move(work)]() mutable {
      services.platform.queues.global(QueuePriority::standard)
          .async([&services, work = std::move(work)]() mutable { services.closing.run(std::move(work)); });
    };
    if (_leavesMainThread()) return _network().stopCapturesThen(std::move(closeElsewhere));
    _network().StopCaptures();
    closeElsewhere();
  }

  const Services& _services;
  const CollectionRequest _request;
  const bool _savesRoom;
  const std::shared_ptr<void> _held;
  const WallTime _startTime;
  const std::shared_ptr<CollectionRecord> _record;
  const CollectionContext _at;
  std::function<void()> _completion;
  std::size_t _index = 0;   // of the next step, among all
  std::size_t _number = 0;  // of those that were taken
  bool _isOnMain = true;
  bool _areCapturesStopped = false;  // for the step that wants them so
};

std::vector<PlannedStep> ServiceCollection::plan(const CollectionRequest& request, bool savesRoom) {
  std::vector<PlannedStep> planned;
  for (const CollectionStep& step : collectionSteps()) {
    planned.push_back({std::string(step.name), step.isWanted(request, savesRoom), step.whyNot(request)});
  }
  for (PlannedStep& step : ClosingStages::plan(request.flags, savesRoom)) planned.push_back(std::move(step));
  return planned;
}

void ServiceCollection::CollectServiceLogs(const CollectionRequest& request,
                                           std::function<void()> completion) {
  Platform& platform = _services.platform;
  platform.agentLog.notice("Copying logs for service " + printable(request.service) + " into path " +
                           request.destination);
  const auto run =
      std::make_shared<Run>(_services, request, _coexistenceDump(request), std::move(completion));
  if (run->savesRoom()) {
    platform.agentLog.notice("The disk has no room for the big logs of service " +
                             printable(request.service));
  }
  run->start();
}

std::function<void()> ServiceCollection::_coexistenceDump(const CollectionRequest& request) {
  if ((request.flags & kCollectMedia) == 0) return {};
  if (!std::exchange(_lookedUpCoexistence, true)) {
    _coexistenceEntryPoint = _services.platform.radioCoexistence.logDumpEntryPoint();
  }
  return _coexistenceEntryPoint;
}

}  // namespace zal
