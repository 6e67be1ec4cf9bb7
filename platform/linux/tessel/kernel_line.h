#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <string_view>

namespace zal::tessel {

/// One message of the kernel's log.
struct KernelMessage {
  std::chrono::microseconds sinceStart{};  ///< on the monotonic clock
  std::string text;
};

/// From "6,339,5140900,-;text"; nothing for the lines with keys that may follow and begin with a blank.
[[nodiscard]] std::optional<KernelMessage> parseKernelLine(std::string_view line);

}  // namespace zal::tessel
