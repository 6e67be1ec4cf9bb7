#include "session/ping_requests.h"

#include "collectors/report_host_name.h"
#include "session/date_text.h"

namespace zal {

std::vector<SessionPing> sessionPings(bool useWifi, const Endpoints& endpoints, const LocalTime& now) {
  const std::string stamp = stampText(now);
  const std::string host = reportHostInFileNames(endpoints);
  // The dot in the cellular file's name is known to those who read it.
  if (!useWifi) return {{endpoints.reportServer, "ping-pdp_ip0-" + host + ".-" + stamp + ".log", false}};
  return {{std::nullopt, "ping-gateway-" + stamp + ".log", true},
          {endpoints.reportServer, "ping-en0-" + host + "-" + stamp + ".log", true}};
}

}  // namespace zal
