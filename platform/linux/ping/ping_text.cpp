#include "platform/linux/ping/ping_text.h"

#include <netinet/icmp6.h>
#include <netinet/ip_icmp.h>

#include "platform/linux/ping/number_text.h"

namespace zal {
namespace {

struct ErrorName {
  std::uint8_t type, code;
  const char* text;
};

constexpr ErrorName kErrorsV4[] = {
    {ICMP_DEST_UNREACH, ICMP_NET_UNREACH, "Destination Net Unreachable"},
    {ICMP_DEST_UNREACH, ICMP_HOST_UNREACH, "Destination Host Unreachable"},
    {ICMP_DEST_UNREACH, ICMP_PROT_UNREACH, "Destination Protocol Unreachable"},
    {ICMP_DEST_UNREACH, ICMP_PORT_UNREACH, "Destination Port Unreachable"},
    {ICMP_DEST_UNREACH, ICMP_FRAG_NEEDED, "Fragmentation Needed"},
    {ICMP_DEST_UNREACH, ICMP_SR_FAILED, "Source Route Failed"},
    {ICMP_DEST_UNREACH, ICMP_NET_UNKNOWN, "Destination Net Unknown"},
    {ICMP_DEST_UNREACH, ICMP_HOST_UNKNOWN, "Destination Host Unknown"},
    {ICMP_DEST_UNREACH, ICMP_NET_ANO, "Destination Net Prohibited"},
    {ICMP_DEST_UNREACH, ICMP_HOST_ANO, "Destination Host Prohibited"},
    {ICMP_DEST_UNREACH, ICMP_PKT_FILTERED, "Packet Filtered"},
    {ICMP_TIME_EXCEEDED, ICMP_EXC_TTL, "Time to Live Exceeded"},
    {ICMP_TIME_EXCEEDED, ICMP_EXC_FRAGTIME, "Fragment Reassembly Time Exceeded"},
};

constexpr ErrorName kErrorsV6[] = {
    {ICMP6_DST_UNREACH, ICMP6_DST_UNREACH_NOROUTE, "Destination Unreachable: No Route"},
    {ICMP6_DST_UNREACH, ICMP6_DST_UNREACH_ADMIN, "Destination Unreachable: Prohibited"},
    {ICMP6_DST_UNREACH, ICMP6_DST_UNREACH_BEYONDSCOPE, "Destination Unreachable: Beyond Scope of Source"},
    {ICMP6_DST_UNREACH, ICMP6_DST_UNREACH_ADDR, "Destination Unreachable: Address Unreachable"},
    {ICMP6_DST_UNREACH, ICMP6_DST_UNREACH_NOPORT, "Destination Unreachable: Port Unreachable"},
    {ICMP6_PACKET_TOO_BIG, 0, "Packet Too Big"},
    {ICMP6_TIME_EXCEEDED, ICMP6_TIME_EXCEED_TRANSIT, "Time Exceeded: Hop Limit"},
    {ICMP6_TIME_EXCEEDED, ICMP6_TIME_EXCEED_REASSEMBLY, "Time Exceeded: Reassembly"},
};

/// Three digits that mean something: nobody reads the nanoseconds of a slow answer.
std::string roundTripText(std::chrono::microseconds roundTrip) {
  const double milliseconds = static_cast<double>(roundTrip.count()) / 1000.0;
  const int decimals = milliseconds < 1 ? 3 : milliseconds < 10 ? 2 : milliseconds < 100 ? 1 : 0;
  return fixedNumber(milliseconds, decimals) + " ms";
}

}  // namespace

std::string pingHeading(IpFamily family, const std::string& host, const std::string& address,
                        const std::string& source, const std::string& interface) {
  const std::string from = source.empty() ? interface : source + " " + interface;
  return "PING " + host + " (" + address + ") from " + from +
         (family == IpFamily::v4 ? ": 56(84) bytes of data." : ": 56 data bytes");
}

std::string answerText(const AnswerLine& answer) {
  std::string text = std::to_string(answer.bytes) + " bytes from " + answer.from +
                     ": icmp_seq=" + std::to_string(answer.sequence);
  if (answer.hops) text += " ttl=" + std::to_string(*answer.hops);
  text += " time=" + roundTripText(answer.roundTrip);
  if (answer.duplicate) text += " (DUP!)";
  return text;
}

std::string icmpErrorText(IpFamily family, std::uint8_t type, std::uint8_t code) {
  const auto search = [&](const auto& names) -> const char* {
    for (const auto& name : names) {
      if (name.type == type && name.code == code) return name.text;
    }
    return nullptr;
  };
  if (const char* text = family == IpFamily::v4 ? search(kErrorsV4) : search(kErrorsV6)) return text;
  return "ICMP error, type " + std::to_string(type) + " code " + std::to_string(code);
}

}  // namespace zal
