#include "bench/servers/rsyslog_server.h"

#include <fstream>
#include <string>

#include "bench/servers/record_text.h"
#include "bench/servers/unix_socket.h"
#include "bench/support/timing.h"

namespace zal::bench {
namespace {

class SyslogSender final : public RecordSender {
 public:
  SyslogSender(const std::filesystem::path& socket, unsigned client)
      : _socket(UnixSocket::Kind::datagram, socket),
        _datagram("<14>Nov  3 10:11:12 callservice: " + RecordText(client).text()),
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

std::string RsyslogServer::start(const std::filesystem::path& folder) {
  const std::string program = findProgram("rsyslogd");
  if (program.empty()) return "rsyslogd is not installed";
  _socket = folder / "log.sock";
  const std::filesystem::path file = folder / "records.log";
  const std::filesystem::path settings = folder / "rsyslog.conf";
  std::ofstream(settings) << "global(workDirectory=\"" << folder.string() << "\")\n"
                          << "module(load=\"imuxsock\" SysSock.Use=\"off\")\n"
                          << "ruleset(name=\"records\") {\n"
                          << "  action(type=\"omfile\" template=\"RSYSLOG_TraditionalFileFormat\" file=\""
                          << file.string() << "\")\n}\n"
                          << "input(type=\"imuxsock\" Socket=\"" << _socket.string()
                          << "\" RateLimit.Interval=\"0\" ruleset=\"records\")\n";
  ChildProcess::Options options;
  options.command = {program, "-n", "-f", settings.string(), "-i", (folder / "rsyslog.pid").string()};
  options.output = folder / "rsyslog.out";
  options.beforeExec = enterPrivateHost;
  _process = ChildProcess(options);
  _file.watch(file);
  const auto ready = [this] { return UnixSocket(UnixSocket::Kind::datagram, _socket).connected(); };
  if (!waitUntil(10, [&] { return !running() || ready(); }) || !running())
    return "rsyslogd does not start here";
  return {};
}

std::unique_ptr<RecordSender> RsyslogServer::connect(unsigned client) {
  return std::make_unique<SyslogSender>(_socket, client);
}

}  // namespace zal::bench
