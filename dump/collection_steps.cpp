#include "dump/collection_steps.h"

#include <system_error>

#include "collectors/directory_listing.h"
#include "collectors/rotated_log_sets.h"
#include "dump/planned_steps.h"
#include "platform/standard_path.h"

namespace zal {
namespace {

constexpr std::string_view kVideoCalls = "Vistel";

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
  if (at.dumpCoexistence) at.dumpCoexistence();
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
  const std::string directory = at.make("Network");
  at.record.keepForThisStep(directory);  // it goes on by itself
  at.collectors.network.queueNetworkDump(directory, at.withPings);
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

constexpr CollectionStep kCollectionSteps[] = {
    {kCollectMedia, "Media and radio logs", collectMedia, true},
    {.flag = kCollectMedia, .name = "Wi-Fi diagnostics", .run = collectWifi, .isForMain = true},
    {kCollectLocation, "Location", collectLocation, true},
    {kCollectCloudSync, "Cloud sync", collectCloudSync},
    {kCollectVideoCalls, "Video-call logs", collectVideoCalls},
    {kCollectProximity, "Proximity and Bluetooth", collectProximity},
    {kCollectHandover, "Hand-over and sharing", collectHandover},
    {kCollectIdentity, "Identity services", collectIdentity},
    {kCollectPrediction, "Activity prediction", collectPrediction},
    {.flag = kCollectNetwork, .name = "Network dump", .run = collectNetwork, .stopsCaptures = true},
    {kCollectRegistration, "Registration and identity", collectRegistration},
    {0, "Local preview", collectLocalPreview},
};

}  // namespace

void CollectionContext::linkSets(const std::vector<std::string>& names, const std::string& directory,
                                 bool includeAllGenerations) const {
  LinkRotatedLogSets(collectors.files, roots(), platform.agentLog, names, directory, includeAllGenerations);
}

bool CollectionStep::isAskedFor(const CollectionRequest& request) const {
  return flag == 0 ? request.service == kVideoCalls : (request.flags & flag) != 0;
}

std::string CollectionStep::whyNot(const CollectionRequest& request) const {
  if (isAskedFor(request)) return std::string(kOverBudget);
  return flag == 0 ? "it belongs to video calls" : flagsNotSet(flag);
}

std::span<const CollectionStep> collectionSteps() { return kCollectionSteps; }

void makeClosingDirectories(const CollectionContext& at) {
  at.make("Push Logs");
  if ((at.request.flags & kCollectBaseband) != 0) at.make("Baseband Logs");
  at.make("Power");
  at.make("Snapshots");
  if ((at.request.flags & kCollectSystemLogs) != 0) at.make("System Logs");
  if ((at.request.flags & (kCollectPushLogs | kCollectNetwork)) != 0) at.make("TCPDump");
}

}  // namespace zal
