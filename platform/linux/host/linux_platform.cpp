#include "platform/linux/host/linux_platform.h"

#include <unistd.h>

#include <csignal>

#include "platform/linux/alerts/alert_file.h"
#include "platform/linux/bus_module/bus_addresses.h"
#include "platform/linux/config/host_paths.h"
#include "platform/linux/disk/kept_places.h"
#include "platform/linux/files/root_parents.h"
#include "platform/linux/files/temporary_leftovers.h"
#include "platform/linux/files/unfinished_files.h"
#include "platform/linux/host/held_text.h"
#include "platform/linux/ipc/client_shares.h"
#include "platform/linux/log/journal_stream.h"
#include "platform/linux/notifications/notification_file.h"
#include "platform/linux/progress/progress_file.h"

namespace zal {
namespace {

bool speaksToJournal(const HostEnvironment& environment) {
  return isJournalStream(environment.variable("JOURNAL_STREAM"), STDERR_FILENO);
}

LinuxAgentLog::Options agentLogOptions(const Configuration& configuration,
                                       const HostEnvironment& environment) {
  LinuxAgentLog::Options options;
  options.categories = configuration.log.categories;
  options.forJournal = speaksToJournal(environment);
  return options;
}

/// One of our helper programs; looked for in PATH when nobody knows where they are.
std::string helperProgram(const Configuration& configuration, const std::string& name) {
  const std::string& directory = configuration.commands.toolDirectory;
  return directory.empty() ? name : directory + "/" + name;
}

RootedPaths rootedPaths(const Configuration& configuration, const HostEnvironment& environment) {
  return {writtenRoots(configuration.roots), environment.homeDirectory};
}

/// What processes left that ended between a file and its name.
void removeUnfinishedIn(const std::string& runtimeRoot, WallTime now) {
  const std::string shares = clientSharesPath(runtimeRoot);
  for (const std::string& directory : {notificationDirectory(runtimeRoot), alertDirectory(runtimeRoot),
                                       shares.substr(0, shares.rfind('/'))}) {
    removeUnfinishedFiles(directory, now);
  }
}

BasebandDumpStarter::Places basebandPlaces(const Configuration& configuration,
                                           const HostEnvironment& environment) {
  return {.helper = helperProgram(configuration, "lirra-modemdump"),
          .directory = configuration.roots.WirelessReportRoot + "/Baseband",
          .marker = configuration.roots.TemporaryRoot + "/Telvane.dumping",
          .paths = rootedPaths(configuration, environment)};
}

/// Of the session that the agent was started from.
bool hasDisplay(const HostEnvironment& environment) {
  return !environment.variable("WAYLAND_DISPLAY").empty() || !environment.variable("DISPLAY").empty();
}

}  // namespace

LinuxPlatform::LinuxPlatform(const HostEnvironment& environment)
    : _loaded(ConfigurationLoader(environment).load()),
      _agentLog(_mainLoop, agentLogOptions(_loaded.configuration, environment)),
      _queues(_mainLoop, [this](std::string_view line) { _agentLog.warning(line); }),
      _memory(_loaded.configuration.memory),
      // Before what may give a job to a thread: it takes variables out of the environment.
      _ipc(_mainLoop.context(), _mainLoop, _agentLog,
           {.path = socketPath(environment).value_or(""),
            .settings = _loaded.configuration.ipc,
            .flush = [this] { _logFiles.flush(); },
            .confirm = [this] { _keepWhatCame(); },
            .memory = &_memory,
            .sharesPath = clientSharesPath(_loaded.configuration.roots.RuntimeRoot)}),
      // Before the log files: what it has to say is in them when the loop sleeps.
      _sessionRecords(_mainLoop, _agentLog, blackBoxDirectory(_loaded.configuration.roots),
                      _loaded.configuration.blackBox),
      _spillFiles(blackBoxDirectory(_loaded.configuration.roots)),
      _logFiles({_clock, _mainLoop, _queues, _agentLog}, _loaded.configuration.roots.UserLogRoot,
                _loaded.configuration.log),
      _logMirror(_logFiles, {_clock, _mainLoop, _agentLog}, _loaded.configuration.log.journalSocket),
      _logFacility(_loaded.configuration.log.journal ? static_cast<PlatformLogFacility&>(_logMirror)
                                                     : _logFiles),
      _preferences(preferenceDirectory(environment), _agentLog),
      _directoryNotifications(_mainLoop.context(),
                              notificationDirectory(_loaded.configuration.roots.RuntimeRoot), _agentLog),
      _crashReporter(_mainLoop.context(), _agentLog,
                     {.helper = helperProgram(_loaded.configuration, "lirra-stackshot"),
                      .reportDirectory = _loaded.configuration.roots.DiagnosticReportRoot}),
      _files(environment.homeDirectory, temporaryArea(_loaded.configuration.roots, environment.userId),
             writtenRoots(_loaded.configuration.roots)),
      _keptStore(keptPlaces(_loaded.configuration.roots, environment.userId), _files),
      _shell(_agentLog),
      _queueingShell(_shell, _queues),
      _systemVersion(_loaded.configuration.systemVersionFile),
      _descriptors(_mainLoop.context()),
      _basebandDumps(_mainLoop.context(), _agentLog, basebandPlaces(_loaded.configuration, environment)),
      _busHost{.configuration = _loaded.configuration,
               .clock = _clock,
               .mainLoop = _mainLoop,
               .queues = _queues,
               .log = _agentLog,
               .descriptors = _descriptors,
               .systemBus = systemBusAddress(environment),
               .sessionBus = sessionBusAddress(environment),
               .isSystem = environment.isSystem(),
               .flush = [this] { _keepWhatCame(); },
               .startBasebandDump = [this](std::string_view reason) { _basebandDumps.start(reason); }},
      _bus(_busHost, busModulePath(environment)),
      _ipcWithBus(_ipc, _bus),
      _systemNotifications(_directoryNotifications, _bus),
      _networkStatus(_bus),
      _cellularData(_bus),
      _telephony(_bus),
      _pings(_mainLoop.context(), _loaded.configuration.interfaces, _agentLog, {},
             rootedPaths(_loaded.configuration, environment)),
      _notificationScreen(_bus),
      _dialogs(_mainLoop.context(), _agentLog, {.hasDisplay = hasDisplay(environment)}),
      _screens({&_notificationScreen, &_dialogs}),
      _userAlerts(_mainLoop.context(), _mainLoop, _clock, _agentLog,
                  alertDirectory(_loaded.configuration.roots.RuntimeRoot)),
      _fileCopier(_queues, _agentLog, _loaded.configuration.archiveCompression,
                  rootedPaths(_loaded.configuration, environment)),
      _deviceSupport(_mainLoop, _clock, _cellularData,
                     {.videoCallsOverCellular = _loaded.configuration.videoCallsOverCellular,
                      .cellularInterface = _loaded.configuration.interfaces.cellular,
                      .looksAtStart = !_loaded.configuration.endpoints.cellPingServer.empty()}),
      _wifiDiagnostics(_agentLog, helperProgram(_loaded.configuration, "lirra-wifidump")),
      _propertyLists(rootedPaths(_loaded.configuration, environment)),
      _dumpRecords(_clock, _agentLog, progressDirectory(_loaded.configuration.roots.RuntimeRoot)),
      _dumpProgress(_dumpRecords, [this](DumpNews news) { _announceDump(std::move(news)); }),
      _processExit([this] {
        _ipc.stopListening();
        _userAlerts.cutOffWaiting();
        _queueingShell.startWhatIsQueued();
        _sessionRecords.flush();
        _logFacility.flush();
      }),
      _hostSignals(_mainLoop, [this] { _announceTermination(); }),
      _services{.configuration = _loaded.configuration,
                .clock = _clock,
                .mainLoop = _mainLoop,
                .queues = _queues,
                .ipc = _ipcWithBus,
                .preferences = _preferences,
                .systemNotifications = _systemNotifications,
                .localNotifications = _localNotifications,
                .logFacility = _logFacility,
                .agentLog = _agentLog,
                .crashReporter = _crashReporter,
                .files = _files,
                .shell = _queueingShell,
                .processes = _processes,
                .deviceRegistry = _deviceRegistry,
                .systemVersion = _systemVersion,
                .networkStatus = _networkStatus,
                .telephony = _telephony,
                .pings = _pings,
                .processExit = _processExit,
                .hostSignals = _hostSignals,
                .userAlerts = _userAlerts,
                .fileCopier = _fileCopier,
                .deviceSupport = _deviceSupport,
                .wifiDiagnostics = _wifiDiagnostics,
                .radioCoexistence = _radioCoexistence,
                .propertyLists = _propertyLists,
                .dumpProgress = _dumpProgress,
                .sessionRecords = _sessionRecords,
                .memory = _memory,
                .spillFiles = _spillFiles,
                .keptStore = _keptStore} {
  std::signal(SIGPIPE, SIG_IGN);
  if (const std::chrono::milliseconds limit{_loaded.configuration.watchdog.limit}; limit.count() > 0) {
    _watchdog.emplace(_clock, limit, [this](auto kind, auto name, auto held) {
      _agentLog.warning(heldText(kind, name, held));
    });
  }
  if (_loaded.configuration.alerts.screen) _userAlerts.showOn(_screens);
  makeRootParents(_loaded.configuration.roots);
  // Where standard error goes to the journal, each line is there already.
  _agentLog.setLogFacility(speaksToJournal(environment) ? &_logFiles : &_logFacility);
  for (const std::string& warning : _loaded.warnings) _agentLog.warning(warning);
  removeUnfinishedIn(_loaded.configuration.roots.RuntimeRoot, _clock.wallNow());
  removeTemporaryLeftoversLater(_queues.global(QueuePriority::background), _clock, _agentLog,
                                temporaryArea(_loaded.configuration.roots, environment.userId));
}

void LinuxPlatform::_keepWhatCame() {
  _sessionRecords.flush();
  _logFiles.flush();
}

void LinuxPlatform::_announceTermination() {
  _ipc.terminationImminent();
  if (BusServices* const services = _bus.loaded()) services->door().terminationImminent();
}

void LinuxPlatform::_announceDump(DumpNews news) {
  if (_bus.loaded() == nullptr) return;
  _mainLoop.post([this, news = std::move(news)] { _bus.loaded()->door().announce(news); });
}

LinuxPlatform::~LinuxPlatform() {
  // The services that go after the facility may still have something to say.
  _agentLog.setLogFacility(nullptr);
}

}  // namespace zal
