#include "bench/servers/agent_server.h"

#include <fstream>
#include <string>

#include "bench/servers/frame_sender.h"
#include "bench/servers/library_sender.h"
#include "bench/servers/record_text.h"
#include "bench/servers/unix_socket.h"
#include "bench/support/timing.h"

namespace zal::bench {

std::filesystem::path AgentServer::socketIn(const std::filesystem::path& folder) {
  return folder / "agent.sock";
}

ChildProcess::Options AgentServer::options(const std::filesystem::path& programFolder,
                                           const std::filesystem::path& folder, std::uint64_t rotationSize,
                                           const std::filesystem::path& journalSocket) {
  const std::string home = folder.string();
  std::ofstream settings(folder / "lirra.toml");
  settings << "[roots]\n";
  for (const char* root : {"UserLogRoot", "MobileLogRoot", "DiagnosticReportRoot", "WirelessLogRoot",
                           "WirelessReportRoot", "RootReportRoot", "SystemLogRoot", "SystemReportRoot",
                           "NetworkConfigRoot", "TemporaryRoot", "VarLogRoot", "RuntimeRoot", "StateRoot"}) {
    settings << root << " = \"" << home << "/" << root << "\"\n";
  }
  settings << "[log]\nrotationSize = " << rotationSize << "\n";
  // The machine's own journal gets nothing of this: the peers write once, too.
  settings << "journal = " << (journalSocket.empty() ? "false" : "true") << "\n";
  if (!journalSocket.empty()) settings << "journalSocket = \"" << journalSocket.string() << "\"\n";
  ChildProcess::Options options;
  options.command = {(programFolder / "zalloggingagent").string()};
  options.environment = {"LIRRA_SOCKET=" + socketIn(folder).string(),
                         "LIRRA_CONFIG=" + home + "/lirra.toml",
                         "HOME=" + home,
                         "XDG_CONFIG_HOME=" + home + "/config",
                         "XDG_STATE_HOME=" + home + "/state",
                         "XDG_RUNTIME_DIR=" + home};
  options.output = folder / "agent.out";
  return options;
}

std::string AgentServer::start(const std::filesystem::path& folder) {
  _socket = socketIn(folder);
  const ChildProcess::Options how = options(_programFolder, folder, _rotationSize, _journalSocket);
  _process = ChildProcess(how);
  const std::string type = kRecordType;
  _file.watch(folder / "UserLogRoot" / type / (type + ".log"));
  const auto ready = [this] { return UnixSocket(UnixSocket::Kind::stream, _socket).connected(); };
  if (!waitUntil(10, [&] { return !running() || ready(); }) || !running()) return "the agent does not start";
  return {};
}

std::string MirroringAgentServer::start(const std::filesystem::path& folder) {
  if (std::string missing = _journal.start(folder); !missing.empty()) return missing;
  setJournal(_journal.socket());
  return AgentServer::start(folder);
}

std::unique_ptr<RecordSender> AgentServer::connect(unsigned client) {
  if (_clients == AgentClients::library) return std::make_unique<LibrarySender>(_socket, client);
  return std::make_unique<FrameSender>(_socket, client);
}

}  // namespace zal::bench
