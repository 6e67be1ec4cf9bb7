#include "bench/ingest/start_up.h"

#include "bench/servers/unix_socket.h"
#include "bench/support/timing.h"

namespace zal::bench {

double measureStartUp(const ChildProcess::Options& daemon, const std::filesystem::path& socket) {
  std::error_code error;
  std::filesystem::remove(socket, error);
  const Stopwatch watch;
  ChildProcess process(daemon);
  while (watch.seconds() < 5) {
    if (UnixSocket(UnixSocket::Kind::stream, socket).connected()) return watch.seconds();
  }
  return -1;
}

}  // namespace zal::bench
