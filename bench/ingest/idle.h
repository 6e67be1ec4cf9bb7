#pragma once

#include <cstdint>
#include <filesystem>
#include <string>

namespace zal::bench {

/// An agent that has worked for a client, who stays connected, and then is left alone. Counts how often
/// the kernel switched to any of its threads.
class IdleWatch {
 public:
  explicit IdleWatch(const std::filesystem::path& programs);
  ~IdleWatch();
  IdleWatch(const IdleWatch&) = delete;
  IdleWatch& operator=(const IdleWatch&) = delete;

  /// Why there is nothing to count, or nothing.
  [[nodiscard]] const std::string& missing() const;
  /// Waits until it has been left alone for so long. Returned: the switches since.
  [[nodiscard]] std::uint64_t switchesAfter(double seconds);

 private:
  struct State;
  State* _state;
};

}  // namespace zal::bench
