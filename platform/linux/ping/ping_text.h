#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "platform/linux/ping/icmp_packet.h"

namespace zal {

/// "PING host (10.0.0.2) from 10.0.0.1 en0: 56(84) bytes of data."; version 6 has no second figure.
/// Without a source the interface stands alone: "from en0:".
[[nodiscard]] std::string pingHeading(IpFamily family, const std::string& host, const std::string& address,
                                      const std::string& source, const std::string& interface);

/// One answer: "64 bytes from 10.0.0.2: icmp_seq=1 ttl=64 time=0.045 ms", "(DUP!)" at its end.
struct AnswerLine {
  std::size_t bytes = 0;
  std::string from;
  std::uint16_t sequence = 0;
  std::optional<int> hops;  ///< what is left of the hop limit, where the host tells
  std::chrono::microseconds roundTrip{0};
  bool duplicate = false;
};
[[nodiscard]] std::string answerText(const AnswerLine& answer);

/// "Destination Host Unreachable" for an ICMP error; type and code as numbers for rare ones.
[[nodiscard]] std::string icmpErrorText(IpFamily family, std::uint8_t type, std::uint8_t code);

}  // namespace zal
