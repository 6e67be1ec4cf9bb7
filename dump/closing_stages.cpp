#include "dump/closing_stages.h"

#include <algorithm>
#include <filesystem>
#include <map>
#include <set>
#include <string_view>
#include <system_error>
#include <utility>

#include "collectors/collectors.h"
#include "dump/archive_gaps.h"
#include "dump/disk_budget_keeper.h"
#include "dump/guarded_step.h"
#include "dump/latest_link.h"
#include "dump/log_compressor.h"
#include "dump/manifest.h"
#include "dump/planned_steps.h"
#include "platform/platform.h"
#include "platform/standard_path.h"

namespace zal {
namespace {

using Services = ClosingStages::Services;

/// One step: it runs when one of its flags is set, or always when it has none.
struct Step {
  CollectionFlags anyOf;
  std::string_view name;
  void (*run)(const Services& services, const ClosingWork& work);
  bool isBig = false;

  [[nodiscard]] bool isAskedFor(CollectionFlags flags) const { return anyOf == 0 || (flags & anyOf) != 0; }
  [[nodiscard]] bool isWanted(CollectionFlags flags, bool savesRoom) const {
    return isAskedFor(flags) && !(savesRoom && isBig);
  }
};

void collectPushLogs(const Services& services, const ClosingWork& work) {
  services.collectors.logs.DumpPushServiceState(work.pushLogs);
  services.collectors.logs.CollectPushCaptureFiles(work.packetCaptures);
}

void collectNetworkStackLogs(const Services& services, const ClosingWork& work) {
  services.collectors.logs.CollectNetworkStackLogs(work.networkStack);
}

void linkThermalLog(const Services& services, const ClosingWork& work) {
  const std::string& root = services.platform.configuration.roots.TemporaryRoot;
  services.collectors.files.LinkFileIntoDirectory(root + "/vistel_thermal_log.txt", work.power, "");
}

void takeStackshot(const Services& services, const ClosingWork& work) {
  if (!services.platform.crashReporter.stackshot("ZalLogging Log Dump", kStackshotCode)) {
    work.record->stepGives(PartState::failed, "the host's crash service made none");
  }
}

void takeBasebandSnapshot(const Services& services, const ClosingWork& work) {
  if (!services.collectors.cellular.DumpBasebandState(work.reason, work.service)) {
    work.record->stepGives(PartState::missing, "the telephony service cannot be reached");
  }
}

void collectSystemLogs(const Services& services, const ClosingWork& work) {
  services.collectors.logs.CollectSystemLogs(work.systemLogs, work.startTime);
}

void collectCrashLogs(const Services& services, const ClosingWork& work) {
  services.collectors.logs.CollectCrashLogs(work.systemLogs);
}

void stopCaptures(const Services& services, const ClosingWork& /*work*/) {
  services.collectors.network.StopCaptures();
}

void collectBasebandLogs(const Services& services, const ClosingWork& work) {
  services.collectors.logs.CollectBasebandLogs(work.basebandLogs, work.startTime);
}

void collectSnapshotLogs(const Services& services, const ClosingWork& work) {
  services.collectors.logs.CollectSnapshotLogs(work.snapshots, work.startTime);
}

void linkFullPacketCapture(const Services& services, const ClosingWork& work) {
  services.collectors.logs.LinkFullPacketCapture(work.packetCaptures);
}

void tellGaps(const Services& services, const ClosingWork& work) {
  tellRunningCommands(work.destination, services.platform.processes, services.platform.agentLog,
                      *work.record);
  tellMissingPrograms(work.destination, *work.record);
}

constexpr std::string_view kArchiveStep = "Archive";
constexpr CollectionFlags kAlways = 0;
constexpr CollectionFlags kAnyNetwork = kCollectPushLogs | kCollectNetwork;

constexpr Step kFirstStage[] = {
    {kCollectPushLogs, "Push logs", collectPushLogs},
    {kAnyNetwork, "Network stack logs", collectNetworkStackLogs},
    {kAlways, "Thermal log", linkThermalLog},
    {kCollectStackshot, "Stackshot", takeStackshot},
    {kCollectBaseband, "Baseband snapshot", takeBasebandSnapshot},
    {kCollectSystemLogs, "System logs", collectSystemLogs, true},
    {kAlways, "Crash logs", collectCrashLogs},
    // The step goes on until the second stage begins.
    {kAlways, "Waiting for slow writers", stopCaptures},
};

constexpr Step kSecondStage[] = {
    {kCollectBaseband, "Baseband logs", collectBasebandLogs, true},
    {kAlways, "Snapshots", collectSnapshotLogs},
    {kAnyNetwork, "Packet captures", linkFullPacketCapture, true},
    // The step goes on until the archive is made.
    {kAlways, kArchiveStep, tellGaps},
};

std::string logRoot(Platform& platform) {
  return resolveAndStandardize(platform.configuration.roots.UserLogRoot, platform.files.homeDirectory());
}

void finish(const Services& services, const ClosingWork& work, const std::string& archive) {
  Platform& platform = services.platform;
  linkLatestArchive(platform.files, logRoot(platform), work.service, archive, platform.agentLog);
  std::error_code error;
  if (std::filesystem::exists(archive, error)) {
    work.record->done(archive);
  } else {
    work.record->failed("no archive was made; the log says why");
  }
  if (services.disk != nullptr) services.disk->look();
  if (work.completion) work.completion();
}

void archiveAndLink(const Services& services, ClosingWork work) {
  const std::string destination = work.destination;
  const auto manifest = [record = work.record,
                         &clock = services.platform.clock](const ArchiveContent& content) {
    return manifestText(record->account(), content, clock.wallNow());
  };
  CompressDirectory(services.compressor, services.platform.agentLog, destination, std::nullopt,
                    [services, work = std::move(work)](const std::optional<std::string>& archive) {
                      finish(services, work, archive.value());
                    },
                    {std::string(kManifestName), manifest});
}

/// One collection's way through the stages. Each job that waits for the next one holds it.
class ClosingRun : public std::enable_shared_from_this<ClosingRun> {
 public:
  ClosingRun(const Services& services, ClosingWork work)
      : _services(services), _work(std::move(work)), _nextStep(_work.firstStep) {}

  void firstStage() {
    _runSteps(kFirstStage);
    _standardQueue().asyncAfter(
        _services.platform.configuration.closingStageDelay.value_or(kSecondStageDelay),
        [self = shared_from_this()] { self->_secondStage(); });
  }

 private:
  WorkQueue& _standardQueue() { return _services.platform.queues.global(QueuePriority::standard); }

  template <std::size_t count>
  void _runSteps(const Step (&steps)[count]) {
    for (const Step& step : steps) {
      if (!step.isWanted(_work.flags, _work.savesRoom)) continue;
      _work.record->step(_nextStep++);
      runGuarded(step.name, *_work.record, _services.platform.agentLog, [&] { step.run(_services, _work); });
    }
  }

  // A modem may take minutes, and a hundred dumps may wait for it: each wait is a timer.
  void _secondStage() {
    if ((_work.flags & kCollectBaseband) != 0 && !_isBasebandComplete()) {
      _standardQueue().asyncAfter(kBasebandPollInterval,
                                  [self = shared_from_this()] { self->_secondStage(); });
      return;
    }
    _runSteps(kSecondStage);
    _archive();
  }

  bool _isBasebandComplete() {
    const std::string marker = _services.platform.configuration.roots.TemporaryRoot + "/Telvane.dumping";
    std::error_code error;
    if (std::filesystem::exists(marker, error)) {
      _services.platform.agentLog.notice("Baseband not complete dumping, file " + marker + " still exists");
      return false;
    }
    _services.platform.agentLog.notice("Baseband complete dumping, file " + marker + " doesn't exist");
    return true;
  }

  void _archive() {
    _services.platform.agentLog.notice("Starting compression for item at path: " + _work.destination);
    archiveAndLink(_services, std::move(_work));
  }

  Services _services;
  ClosingWork _work;
  std::size_t _nextStep;
};

/// To archive one directory, the first included.
constexpr int kMostAttempts = 3;

/// What is known of a former agent's steps: which began, and so that it ended in the last of them.
std::vector<PlannedStep> formerSteps(const CutOffDump& dump) {
  std::vector<PlannedStep> steps;
  std::size_t lastBegun = 0;
  for (const CutOffDump::Step& step : dump.steps) {
    if (step.name == kArchiveStep) continue;
    if (step.began) lastBegun = steps.size();
    steps.push_back({step.name, false, step.began ? "" : "the agent ended before it",
                     step.began ? PartState::done : PartState::notRun});
  }
  if (!steps.empty() && steps[lastBegun].unwanted == PartState::done) {
    steps[lastBegun].unwanted = PartState::partial;
    steps[lastBegun].whyNot = "the agent ended in it";
  }
  steps.push_back({std::string(kArchiveStep), true, ""});
  return steps;
}

/// Whether something of its own was written into the directory after the archive was made: a session's
/// recovered logs. Linked logs are others'.
bool holdsNewer(const std::string& directory, const std::string& archive) {
  std::error_code error;
  const auto made = std::filesystem::last_write_time(archive, error);
  for (std::filesystem::directory_iterator entry(directory, error), end; !error && entry != end;
       entry.increment(error)) {
    if (entry->is_regular_file(error) && entry->hard_link_count(error) == 1 &&
        entry->last_write_time(error) > made)
      return true;
  }
  return false;
}

/// The archive had its name before the agent ended: it was whole. What was left to do then is done now.
void tidyUpAfter(const CutOffDump& dump, const std::string& archive, Platform& platform) {
  platform.queues.global(QueuePriority::standard).async([dump, archive, &platform] {
    if (!holdsNewer(dump.directory, archive)) platform.files.remove(dump.directory);
    platform.queues.main().async([service = dump.service, archive, &platform] {
      linkArchiveOfEarlier(platform.files, logRoot(platform), service, archive, platform.agentLog);
    });
  });
}

bool wasBeingArchived(const CutOffDump& dump) {
  return std::any_of(dump.steps.begin(), dump.steps.end(),
                     [](const CutOffDump::Step& step) { return step.began && step.name == kArchiveStep; });
}

}  // namespace

void ClosingStages::run(ClosingWork work) {
  std::make_shared<ClosingRun>(_services, std::move(work))->firstStage();
}

void ClosingStages::finishCutOff() {
  Platform& platform = _services.platform;
  const std::vector<CutOffDump> dumps = platform.dumpProgress.cutOff();
  std::map<std::string, int> attempts;
  std::set<std::string> beingArchived;
  for (const CutOffDump& dump : dumps) {
    ++attempts[dump.directory];
    if (wasBeingArchived(dump)) beingArchived.insert(dump.directory);
  }
  std::set<std::string> directories;
  for (const CutOffDump& dump : dumps) {
    // What ends the agent each time is left to people.
    if (attempts[dump.directory] > kMostAttempts) continue;
    std::error_code error;
    if (!directories.insert(dump.directory).second) continue;
    if (const std::string archive = dump.directory + ".zip"; std::filesystem::exists(archive, error)) {
      if (beingArchived.contains(dump.directory)) tidyUpAfter(dump, archive, platform);
      continue;
    }
    if (!std::filesystem::is_directory(dump.directory, error)) continue;
    platform.agentLog.notice("Finishing the collection of a former agent at path: " + dump.directory);
    ClosingWork work;
    work.service = dump.service;
    work.destination = dump.directory;
    if (_services.disk != nullptr) work.held = _services.disk->hold(dump.directory);
    work.record = beginRecord(platform, _services.collectors.witnesses,
                              {.service = dump.service,
                               .directory = dump.directory,
                               .flags = 0,
                               .steps = formerSteps(dump),
                               .isFinishedLater = true});
    platform.queues.global(QueuePriority::standard)
        .async([services = _services, work = std::move(work)]() mutable {
          work.record->step(1);
          runGuarded(kArchiveStep, *work.record, services.platform.agentLog,
                     [&] { tellGaps(services, work); });
          archiveAndLink(services, std::move(work));
        });
  }
}

std::vector<PlannedStep> ClosingStages::plan(CollectionFlags flags, bool savesRoom) {
  std::vector<PlannedStep> planned;
  const auto add = [&](const auto& steps) {
    for (const Step& step : steps) {
      planned.push_back({std::string(step.name), step.isWanted(flags, savesRoom),
                         step.isAskedFor(flags) ? std::string(kOverBudget) : flagsNotSet(step.anyOf)});
    }
  };
  add(kFirstStage);
  add(kSecondStage);
  return planned;
}

}  // namespace zal
