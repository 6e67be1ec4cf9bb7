#include "bench/servers/log_server.h"

#include "bench/support/timing.h"

namespace zal::bench {

bool LogServer::warmUp() {
  const std::unique_ptr<RecordSender> client = connect(0);
  client->send(0);
  client->finish();
  return waitUntil(5, [this] { return _noticeFirstRecord(); });
}

}  // namespace zal::bench
