#include "session/ping_requests.h"

#include <algorithm>

#include "session/date_text.h"

namespace zal {

namespace {

// The host as a part of a file name.
std::string hostPart(const std::string& host) {
  if (host.empty()) return "reportHost";
  std::string part = host;
  std::replace(part.begin(), part.end(), '/', '_');
  return part;
}

}  // namespace

std::vector<SessionPing> sessionPings(bool useWifi, const Endpoints& endpoints, const LocalTime& now) {
  const std::string stamp = stampText(now);
  const std::string host = hostPart(endpoints.reportServer);
  // The dot in the cellular file's name is known to those who read it.
  if (!useWifi) return {{endpoints.reportServer, "ping-pdp_ip0-" + host + ".-" + stamp + ".log", false}};
  return {{std::nullopt, "ping-gateway-" + stamp + ".log", true},
          {endpoints.reportServer, "ping-en0-" + host + "-" + stamp + ".log", true}};
}

}  // namespace zal
