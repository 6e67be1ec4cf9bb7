#include "bench/servers/journald_server.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <string>

#include "bench/servers/record_text.h"
#include "bench/servers/unix_socket.h"
#include "bench/support/timing.h"

namespace zal::bench {
namespace {

// Everything at its default but what would lose or copy records: no rate limit, no forwarding, room for
// all of them.
constexpr char kSettings[] =
    "[Journal]\nStorage=volatile\nRateLimitIntervalSec=0\nRateLimitBurst=0\nForwardToSyslog=no\n"
    "ForwardToKMsg=no\nForwardToConsole=no\nForwardToWall=no\nReadKMsg=no\nAudit=no\n"
    "RuntimeMaxUse=3G\nRuntimeKeepFree=1M\nRuntimeMaxFiles=1000\n";

const char* prepareHost() {
  if (const char* failed = enterPrivateHost()) return failed;
  mkdir("/run/systemd", 0755);
  mkdir("/run/systemd/journal", 0755);
  mkdir("/run/systemd/journald.conf.d", 0755);
  mkdir("/run/log", 0755);
  mkdir("/run/log/journal", 0755);
  const int file = open("/run/systemd/journald.conf.d/bench.conf", O_WRONLY | O_CREAT | O_CLOEXEC, 0644);
  const bool written = file >= 0 && write(file, kSettings, sizeof kSettings - 1) > 0;
  close(file);
  return written ? nullptr : "settings";
}

class JournalSender final : public RecordSender {
 public:
  JournalSender(const std::filesystem::path& socket, unsigned client)
      : _socket(UnixSocket::Kind::datagram, socket),
        _datagram("MESSAGE=" + RecordText(client).text() + "\nPRIORITY=6\nSYSLOG_IDENTIFIER=callservice\n"),
        _position(numberPosition(_datagram)) {}
  void send(std::uint64_t number) override {
    putNumber(_datagram, _position, number);
    _socket.sendAll(_datagram);
  }

 private:
  UnixSocket _socket;
  std::string _datagram;
  std::size_t _position;
};

}  // namespace

std::string JournaldServer::start(const std::filesystem::path& folder) {
  const std::string program = findProgram("systemd-journald");
  if (program.empty()) return "systemd-journald is not installed";
  ChildProcess::Options options;
  options.command = {program};
  options.output = folder / "journald.out";
  options.beforeExec = prepareHost;
  _process = ChildProcess(options);
  _run = "/proc/" + std::to_string(_process.id()) + "/root/run";
  // Its socket accepts before its file exists, so the file with the first entry is the sign.
  const auto ready = [this] {
    std::error_code error;
    for (const auto& machine : std::filesystem::directory_iterator(directory(), error)) {
      _count.watch(machine.path() / "system.journal");
    }
    return _count.entries() > 0 && UnixSocket(UnixSocket::Kind::datagram, socket()).connected();
  };
  if (!waitUntil(10, [&] { return !running() || ready(); }) || !running()) {
    return "systemd-journald does not start here (private namespaces needed)";
  }
  pauseMilliseconds(100);
  _ownEntries = _count.entries();
  return {};
}

std::unique_ptr<RecordSender> JournaldServer::connect(unsigned client) {
  return std::make_unique<JournalSender>(socket(), client);
}

std::uint64_t JournaldServer::stored() { return _count.entries() - _ownEntries; }

std::uint64_t JournaldServer::storedByReading() {
  const std::string command =
      "journalctl --quiet --directory=" + directory().string() +
      " --output=cat --output-fields=MESSAGE SYSLOG_IDENTIFIER=callservice 2>/dev/null";
  FILE* lines = popen(command.c_str(), "r");
  if (lines == nullptr) return 0;
  std::uint64_t count = 0;
  char line[4096];
  while (fgets(line, sizeof line, lines) != nullptr) count += strstr(line, " record ") != nullptr ? 1 : 0;
  pclose(lines);
  return count;
}

}  // namespace zal::bench
