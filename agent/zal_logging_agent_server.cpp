#include "agent/zal_logging_agent_server.h"

#include <array>
#include <exception>
#include <utility>

#include "agent/message_handler.h"
#include "agent/verbose_log_purge.h"
#include "platform/standard_path.h"
#include "session/session_writings.h"

namespace zal {
namespace {

constexpr std::array<std::string_view, 4> SessionTypeList = {"Registration", "Nexa", "Messages", "Vistel"};

/// The process's own: plain pointers that nothing destroys at exit, so that no order of static
/// destruction can reach a host service that is gone already.
struct SharedState {
  Platform* platform = nullptr;
  SessionServices* sessionServices = nullptr;
  AgentHooks* hooks = nullptr;
  bool observesPreferences = false;
  ZalLoggingAgentServer* server = nullptr;
};
SharedState shared;

}  // namespace

void ZalLoggingAgentServer::lendPlatform(Platform& platform, SessionServices& sessionServices,
                                         AgentHooks hooks) {
  delete shared.hooks;
  shared.platform = &platform;
  shared.sessionServices = &sessionServices;
  shared.hooks = new AgentHooks(std::move(hooks));
}

ZalLoggingAgentServer* ZalLoggingAgentServer::sharedInstance() {
  if (shared.platform == nullptr) return nullptr;
  if (!shared.observesPreferences) {
    shared.observesPreferences = true;
    shared.platform->systemNotifications.observe(std::string(kSyncPreferencesNotification), [] {
      if (shared.server != nullptr) shared.server->readLoggingPreferences();
    });
  }
  // The null test alone guards the creation: all callers are on the main thread.
  if (shared.server == nullptr) {
    try {
      shared.server = new ZalLoggingAgentServer(*shared.platform, *shared.sessionServices, *shared.hooks);
    } catch (const std::exception& error) {
      shared.platform->agentLog.warning(std::string("The server could not be set up: ") + error.what());
    }
  }
  return shared.server;
}

void ZalLoggingAgentServer::resetSharedInstanceForTests() {
  delete std::exchange(shared.server, nullptr);
  delete shared.hooks;
  shared = {};
}

ZalLoggingAgentServer::ZalLoggingAgentServer(Platform& platform, SessionServices& sessionServices,
                                             AgentHooks hooks)
    : _platform(platform),
      _hooks(std::move(hooks)),
      _sessionServices(sessionServices),
      _delayedEnds(std::make_shared<int>()) {
  readLoggingPreferences();
  _inactiveSessionObserver = _platform.localNotifications.observe(
      std::string(kSessionBecameInactive), [this](void* session) { _sessionBecameInactive(session); });
  _noteActivity();
  purgeVerboseLogs(
      _platform.files,
      resolveAndStandardize(_platform.configuration.roots.MobileLogRoot, _platform.files.homeDirectory()),
      SessionTypeList);
}

ZalLoggingAgentServer::~ZalLoggingAgentServer() {
  _platform.localNotifications.removeObserver(_inactiveSessionObserver);
  stop();
}

void ZalLoggingAgentServer::start() {
  _mainThread.check("ZalLoggingAgentServer");
  if (!_listener) {
    _listener = _platform.ipc.makeListener(std::string(kListenerServiceName));
    _listener->resume(
        [this] {
          _platform.agentLog.warning("Connection went invalid, exiting");
          _platform.processExit.exit(0);
        },
        MessageHandler(*this, _platform.agentLog, _platform.clock, _sessionServices.writings));
  }
  _noteActivity();
}

void ZalLoggingAgentServer::stop() {
  endAllSessions();
  if (_sessionServices.writings != nullptr) _sessionServices.writings->finishAll();
  _noteActivity();
}

bool ZalLoggingAgentServer::readLoggingPreferences() {
  _mainThread.check("ZalLoggingAgentServer");
  return _switches.read(_platform.preferences);
}

void ZalLoggingAgentServer::performAction(std::int64_t action, OptionalText session, OptionalText sender,
                                          const std::shared_ptr<PeerConnection>& peer, const Message* request,
                                          const ValueMap* userInfo) {
  _noteActivity();
  _hooks.performAction(ActionRequest{action, session, sender, peer, request, userInfo}, *this);
  _noteActivity();
}

void ZalLoggingAgentServer::startPing(OptionalText sessionType, bool useWifi) {
  if (const Session session = _sessionForSessionType(sessionType, false)) session->startPing(useWifi);
}

}  // namespace zal
