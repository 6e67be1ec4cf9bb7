#include "dump/service_collection.h"

#include <string_view>
#include <utility>

#include "collectors/collectors.h"
#include "collectors/directory_listing.h"
#include "collectors/rotated_log_sets.h"
#include "dump/disk_budget_keeper.h"
#include "dump/planned_steps.h"
#include "platform/platform.h"
#include "platform/standard_path.h"
#include "session/collected_files.h"

namespace zal {
namespace {

constexpr std::string_view kVideoCalls = "Vistel";

/// What the steps of one collection work with.
struct CollectionContext {
  Platform& platform;
  Collectors& collectors;
  const CollectionRequest& request;
  CollectionRecord& record;
  const SignalWait& wait;
  std::function<void()> dumpCoexistence;

  [[nodiscard]] const DirectoryRoots& roots() const { return platform.configuration.roots; }
  [[nodiscard]] const CollectionSettings& settings() const { return platform.configuration.collection; }
  [[nodiscard]] FileCollector& files() const { return collectors.files; }
  [[nodiscard]] std::string in(std::string_view name) const {
    return std::string(request.destination).append("/").append(name);
  }
  std::string make(std::string_view name) const {
    std::string directory = in(name);
    platform.files.makeDirectories(directory);
    return directory;
  }
  void makeDestination() const { platform.files.makeDirectories(request.destination); }
  void linkSets(const std::vector<std::string>& names, const std::string& directory,
                bool includeAllGenerations = false) const {
    LinkRotatedLogSets(collectors.files, roots(), platform.agentLog, names, directory, includeAllGenerations);
  }
};

void collectMedia(const CollectionContext& at) {
  FileCollector& files = at.files();
  at.makeDestination();
  files.LinkDirectoryEntriesWithPrefix(at.roots().MediaLogCacheDir, "Jitter", at.request.destination);
  at.linkSets({"Phone"}, at.make("Phone"));
  files.LinkDirectoryEntriesWithPrefix(at.roots().MobileLogRoot, "RadioMarshal", at.make("RadioMarshal"));
  files.LinkDirectoryEntriesWithPrefix(at.roots().SystemReportRoot, "tcpdump", at.make("TCPDump"));
  // Made by the first link only: without such logs there is no directory.
  files.LinkDirectoryEntriesWithPrefix(at.roots().SystemReportRoot, "com.vendel.networking.pelliton",
                                       at.in("Pelliton"));
  at.dumpCoexistence();
  // What the manager has just written, if there is one.
  files.LinkDirectoryEntriesWithPrefix(at.roots().DiagnosticReportRoot, "RadioMarshal",
                                       at.make("RadioMarshal"));
}

void collectWifi(const CollectionContext& at) {
  takeWifiDump(at.platform, at.request.service, at.request.reason, at.wait, at.record);
  at.files().LinkDirectoryEntriesWithPrefix(at.roots().SystemReportRoot, "setkey", at.request.destination);
}

void collectLocation(const CollectionContext& at) {
  const std::string directory = at.make("Location");
  const std::string source =
      resolveAndStandardize(at.roots().LocationCacheDir, at.platform.files.homeDirectory());
  const GatheringWitnesses& witnesses = at.collectors.witnesses;
  const auto names = listDirectory(source, HiddenEntries::listed);
  if (!names) return witnesses.source(source, directory, SourceOutcome::absent);
  for (const std::string& name : *names) {
    const std::error_code error = at.platform.files.copy(source + "/" + name, directory + "/" + name);
    witnesses.source(source + "/" + name, directory, error ? SourceOutcome::failed : SourceOutcome::taken,
                     error ? error.message() : "");
  }
}

void collectCloudSync(const CollectionContext& at) {
  at.makeDestination();
  const std::string& log = at.settings().cloudSyncLog;
  if (log.empty()) return;
  at.files().LinkFileIntoDirectory(at.roots().DiagnosticReportRoot + "/DiagnosticLogs/" + log,
                                   at.request.destination, "");
}

void collectVideoCalls(const CollectionContext& at) {
  at.make("Vistel");
  at.linkSets({std::string(kVideoCalls)}, at.request.destination);
}

void collectProximity(const CollectionContext& at) {
  at.files().LinkFileIntoDirectory(at.roots().MobileLogRoot + "/nearwaved-latest.log", at.make("Nearwave"),
                                   "");
  const std::string bluetooth = at.make("Bluetooth");
  at.record.keepForThisStep(bluetooth);  // half of it comes later
  at.collectors.logs.CollectBluetoothLogs(bluetooth);
}

void collectHandover(const CollectionContext& at) {
  const std::string launch = at.make("Launchpath");
  at.files().LinkDirectoryEntriesWithPrefix(at.roots().MobileLogRoot + "/Handover/", "", launch);
  at.collectors.table.runInBackground(at.collectors.commands, CommandGroup::handover, launch);
  const std::string sharing = at.make("Sharing");
  at.files().LinkDirectoryEntriesWithPrefix(at.roots().MobileLogRoot + "/com.vendel.sharewell/", "", sharing);
  at.collectors.table.runInBackground(at.collectors.commands, CommandGroup::sharing, sharing);
}

void collectIdentity(const CollectionContext& at) {
  at.linkSets({"Nexa", "NexaIDQuery", "Transport", "Messages"}, at.make("Nexa"));
  at.files().LinkDirectoryEntriesWithPrefix(at.roots().TemporaryRoot, "uart-", at.make("uart"));
  at.linkSets({"Phone"}, at.make("Phone"));
  at.linkSets({"Phone Tandem"}, at.make("Phone Tandem"));
}

void collectPrediction(const CollectionContext& at) {
  const std::string directory = at.make("Kinsight");
  for (const char* prefix : {"kinsight", "KinsightHeuristic-BM"}) {
    at.files().LinkDirectoryEntriesWithPrefix(at.roots().MobileLogRoot, prefix, directory);
  }
}

void collectNetwork(const CollectionContext& at) {
  const bool includePing = (at.request.flags & kCollectPings) != 0;
  const std::string directory = at.make("Network");
  at.record.keepForThisStep(directory);  // it goes on by itself
  at.collectors.network.ForceNetworkDump(directory, includePing);
}

void collectRegistration(const CollectionContext& at) {
  FileCollector& files = at.files();
  const std::string directory = at.make("Registration");
  at.linkSets({"Registration"}, directory, true);
  at.collectors.table.runInBackground(at.collectors.commands, CommandGroup::registration, directory);
  for (const std::string* log : {&at.settings().pairedDeviceLog1, &at.settings().pairedDeviceLog2}) {
    if (!log->empty()) files.LinkFileIntoDirectory(*log, directory, "");
  }
  const std::string& pairedDevices = at.settings().pairedDeviceDirectory;
  if (!pairedDevices.empty()) files.CopyDirectoryContents(pairedDevices, directory);
  for (const char* name : {"/Bluetooth", "/PocketBluetooth", "/Tandemsync"}) {
    files.CopyDirectoryContents(at.roots().MobileLogRoot + name, directory);
  }
  files.LinkFileIntoDirectory(at.roots().SystemLogRoot + "/tetherd.log", directory, "");
  files.CopyDirectoryContents(at.roots().DiagnosticReportRoot + "/DiagnosticLogs/Accounts", directory);
}

void collectLocalPreview(const CollectionContext& at) {
  at.files().LinkFileIntoDirectory(at.roots().MobileLogRoot + "/LocalPreview/LocalPreview.log",
                                   at.make("LocalPreview"), "");
}

/// One row of a collection. Without a flag it belongs to video calls, whatever is asked for.
struct CollectionStep {
  CollectionFlags flag;
  std::string_view name;
  void (*run)(const CollectionContext& at);
  bool isBig = false;  ///< what it takes lies on the disk already, and would be there once more

  [[nodiscard]] bool isAskedFor(const CollectionRequest& request) const {
    return flag == 0 ? request.service == kVideoCalls : (request.flags & flag) != 0;
  }
  [[nodiscard]] bool isWanted(const CollectionRequest& request, bool savesRoom) const {
    return isAskedFor(request) && !(savesRoom && isBig);
  }
  [[nodiscard]] std::string whyNot(const CollectionRequest& request) const {
    if (isAskedFor(request)) return std::string(kOverBudget);
    return flag == 0 ? "it belongs to video calls" : flagsNotSet(flag);
  }
};

constexpr CollectionStep kSteps[] = {
    {kCollectMedia, "Media and radio logs", collectMedia, true},
    {kCollectMedia, "Wi-Fi diagnostics", collectWifi},
    {kCollectLocation, "Location", collectLocation, true},
    {kCollectCloudSync, "Cloud sync", collectCloudSync},
    {kCollectVideoCalls, "Video-call logs", collectVideoCalls},
    {kCollectProximity, "Proximity and Bluetooth", collectProximity},
    {kCollectHandover, "Hand-over and sharing", collectHandover},
    {kCollectIdentity, "Identity services", collectIdentity},
    {kCollectPrediction, "Activity prediction", collectPrediction},
    {kCollectNetwork, "Network dump", collectNetwork},
    {kCollectRegistration, "Registration and identity", collectRegistration},
    {0, "Local preview", collectLocalPreview},
};

void makeClosingDirectories(const CollectionContext& at) {
  at.make("Push Logs");
  if ((at.request.flags & kCollectBaseband) != 0) at.make("Baseband Logs");
  at.make("Power");
  at.make("Snapshots");
  if ((at.request.flags & kCollectSystemLogs) != 0) at.make("System Logs");
  if ((at.request.flags & (kCollectPushLogs | kCollectNetwork)) != 0) at.make("TCPDump");
}

}  // namespace

std::vector<PlannedStep> ServiceCollection::plan(const CollectionRequest& request, bool savesRoom) {
  std::vector<PlannedStep> planned;
  for (const CollectionStep& step : kSteps) {
    planned.push_back({std::string(step.name), step.isWanted(request, savesRoom), step.whyNot(request)});
  }
  for (PlannedStep& step : ClosingStages::plan(request.flags, savesRoom)) planned.push_back(std::move(step));
  return planned;
}

void ServiceCollection::CollectServiceLogs(const CollectionRequest& request,
                                           std::function<void()> completion) {
  Platform& platform = _services.platform;
  const WallTime startTime = platform.clock.wallNow();
  platform.agentLog.notice("Copying logs for service " + printable(request.service) + " into path " +
                           request.destination);
  DiskBudgetKeeper* const disk = _services.disk;
  const bool savesRoom = disk != nullptr && !disk->admits(request.service);
  if (savesRoom) {
    platform.agentLog.notice("The disk has no room for the big logs of service " +
                             printable(request.service));
  }
  const auto record = beginRecord(platform, _services.collectors.witnesses,
                                  {.service = request.service,
                                   .directory = request.destination,
                                   .flags = request.flags,
                                   .steps = plan(request, savesRoom)});
  const CollectionContext at{platform, _services.collectors, request,
                             *record,  _services.wait,       [this] { _dumpCoexistence(); }};
  std::size_t number = 0;
  for (const CollectionStep& step : kSteps) {
    if (!step.isWanted(request, savesRoom)) continue;
    record->step(++number);
    step.run(at);
  }
  makeClosingDirectories(at);
  ClosingWork work{.service = request.service,
                   .destination = request.destination,
                   .pushLogs = at.in("Push Logs"),
                   .networkStack = at.in("Webstrand"),
                   .systemLogs = at.in("System Logs"),
                   .basebandLogs = at.in("Baseband Logs"),
                   .snapshots = at.in("Snapshots"),
                   .packetCaptures = at.in("TCPDump"),
                   .power = at.in("Power"),
                   .reason = request.reason,
                   .flags = request.flags,
                   .savesRoom = savesRoom,
                   .held = disk != nullptr ? disk->hold(request.destination) : nullptr,
                   .startTime = startTime,
                   .record = record,
                   .firstStep = number + 1,
                   .completion = std::move(completion)};
  _services.collectors.network.StopCaptures();
  if (!request.background) {
    _services.closing.run(std::move(work));
    return;
  }
  platform.queues.global(QueuePriority::standard)
      .async([&closing = _services.closing, work = std::move(work)] { closing.run(work); });
}

void ServiceCollection::_dumpCoexistence() {
  if (!std::exchange(_lookedUpCoexistence, true)) {
    _coexistenceEntryPoint = _services.platform.radioCoexistence.logDumpEntryPoint();
  }
  if (_coexistenceEntryPoint) _coexistenceEntryPoint();
}

}  // namespace zal
