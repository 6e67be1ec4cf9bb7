#include "examples/loopback_call/packet_trace.h"

#include <stdexcept>

namespace loopback {

PacketTrace::PacketTrace(const std::string& path) : _file(path, std::ios::trunc) {
  if (!_file) throw std::runtime_error("cannot write " + path);
  _file << "second,side,sent,received,rtt_ms,jitter_ms,loss_percent\n";
}

void PacketTrace::add(int second, const MediaEndpoint& caller, const MediaEndpoint& callee) {
  const auto line = [&](const char* side, const MediaEndpoint& endpoint) {
    const ReceptionStatistics& seen = endpoint.statistics();
    _file << second << ',' << side << ',' << endpoint.sent() << ',' << seen.packets() << ','
          << seen.roundTripMilliseconds().value_or(0.0) << ',' << seen.jitterMilliseconds() << ','
          << seen.lossPercent() << '\n';
  };
  line("caller", caller);
  line("callee", callee);
  _file.flush();
}

}  // namespace loopback
