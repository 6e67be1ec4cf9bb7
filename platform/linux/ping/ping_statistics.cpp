#include "platform/linux/ping/ping_statistics.h"

#include <algorithm>
#include <cmath>

#include "platform/linux/ping/number_text.h"

namespace zal {

void PingStatistics::addAnswer(std::chrono::microseconds roundTrip) {
  const auto value = static_cast<double>(roundTrip.count());
  _least = _received == 0 ? value : std::min(_least, value);
  _greatest = _received == 0 ? value : std::max(_greatest, value);
  ++_received;
  const double deviation = value - _mean;
  _mean += deviation / static_cast<double>(_received);
  _squaredDeviations += deviation * (value - _mean);
}

std::string PingStatistics::summary() const {
  std::string text =
      std::to_string(transmitted) + " packets transmitted, " + std::to_string(_received) + " received";
  if (duplicates > 0) text += ", +" + std::to_string(duplicates) + " duplicates";
  if (errors > 0) text += ", +" + std::to_string(errors) + " errors";
  if (transmitted > 0) {
    const std::uint64_t lost = transmitted - std::min(transmitted, _received);
    text += ", " + shortNumber(100.0 * static_cast<double>(lost) / static_cast<double>(transmitted)) +
            "% packet loss";
  }
  return text + ", time " + std::to_string(elapsed.count()) + "ms";
}

std::string PingStatistics::roundTripLine() const {
  if (_received == 0) return {};
  const double deviation = std::sqrt(_squaredDeviations / static_cast<double>(_received));
  const auto milliseconds = [](double microseconds) { return fixedNumber(microseconds / 1000.0, 3); };
  return "rtt min/avg/max/mdev = " + milliseconds(_least) + "/" + milliseconds(_mean) + "/" +
         milliseconds(_greatest) + "/" + milliseconds(deviation) + " ms";
}

}  // namespace zal
