#pragma once

#include <vector>

#include "bench/servers/journald_server.h"
#include "bench/servers/line_file.h"
#include "bench/servers/log_server.h"

namespace zal::bench {

/// How clients of the agent write.
enum class AgentClients {
  oneRecordAWrite,  ///< ready-made frames, one system call each
  library,          ///< the client library as it comes, encoding and batching included
};

/// The agent with everything it keeps in a folder of its own.
class AgentServer : public LogServer {
 public:
  AgentServer(std::filesystem::path programFolder, AgentClients clients)
      : _programFolder(std::move(programFolder)), _clients(clients) {}
  /// Large enough that a run does not rotate; the peers do not rotate, or keep what they rotate as it is.
  void setRotationSize(std::uint64_t bytes) { _rotationSize = bytes; }
  /// Copies of the records go there; to no journal otherwise.
  void setJournal(std::filesystem::path socket) { _journalSocket = std::move(socket); }
  [[nodiscard]] std::string_view name() const override { return "agent"; }
  [[nodiscard]] std::string start(const std::filesystem::path& folder) override;
  [[nodiscard]] std::unique_ptr<RecordSender> connect(unsigned client) override;
  [[nodiscard]] std::uint64_t stored() override { return _file.lines(); }
  [[nodiscard]] std::uint64_t storedByReading() override { return _file.linesByReading(); }

  /// Program and surroundings for an agent in that folder, for those who start it themselves.
  [[nodiscard]] static ChildProcess::Options options(const std::filesystem::path& programFolder,
                                                     const std::filesystem::path& folder,
                                                     std::uint64_t rotationSize,
                                                     const std::filesystem::path& journalSocket = {});
  [[nodiscard]] static std::filesystem::path socketIn(const std::filesystem::path& folder);

 private:
  [[nodiscard]] bool _noticeFirstRecord() override { return _file.learnLineLength(); }
  std::filesystem::path _programFolder;
  AgentClients _clients;
  std::uint64_t _rotationSize = 1U << 30U;
  std::filesystem::path _socket;
  std::filesystem::path _journalSocket;
  LineFile _file;
};

/// The agent with a journal of its own beside it, which gets copies.
class MirroringAgentServer final : public AgentServer {
 public:
  explicit MirroringAgentServer(std::filesystem::path programFolder)
      : AgentServer(std::move(programFolder), AgentClients::oneRecordAWrite) {}
  [[nodiscard]] std::string start(const std::filesystem::path& folder) override;

 private:
  JournaldServer _journal;
};

}  // namespace zal::bench
