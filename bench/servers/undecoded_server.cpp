#include "bench/servers/undecoded_server.h"

#include "bench/servers/frame_sender.h"
#include "bench/servers/unix_socket.h"
#include "bench/support/timing.h"

namespace zal::bench {

std::string UndecodedServer::start(const std::filesystem::path& folder) {
  _socket = folder / "log.sock";
  const std::filesystem::path file = folder / "records.bin";
  ChildProcess::Options options;
  options.command = {(_programFolder / "undecoded_reader").string(), _socket.string(), file.string()};
  options.output = folder / "undecoded.out";
  _process = ChildProcess(options);
  _file.watch(file);
  const auto ready = [this] { return UnixSocket(UnixSocket::Kind::stream, _socket).connected(); };
  if (!waitUntil(10, [&] { return !running() || ready(); }) || !running())
    return "undecoded_reader does not start";
  return {};
}

std::unique_ptr<RecordSender> UndecodedServer::connect(unsigned client) {
  return std::make_unique<FrameSender>(_socket, client);
}

}  // namespace zal::bench
