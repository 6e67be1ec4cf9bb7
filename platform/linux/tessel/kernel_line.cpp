#include "platform/linux/tessel/kernel_line.h"

#include <charconv>
#include <cstddef>
#include <cstdint>

namespace zal::tessel {

std::optional<KernelMessage> parseKernelLine(std::string_view line) {
  const std::size_t head = line.find(';');
  if (line.starts_with(' ') || head == std::string_view::npos) return std::nullopt;
  // Level, number, time and flags; later kernels may put more before the semicolon.
  const std::size_t first = line.find(',');
  const std::size_t second = first < head ? line.find(',', first + 1) : std::string_view::npos;
  if (second >= head) return std::nullopt;
  std::int64_t time = 0;
  const auto [end, error] = std::from_chars(line.data() + second + 1, line.data() + head, time);
  if (error != std::errc() || (*end != ',' && *end != ';') || time < 0) return std::nullopt;
  return KernelMessage{std::chrono::microseconds(time), std::string(line.substr(head + 1))};
}

}  // namespace zal::tessel
