#pragma once

#include <chrono>
#include <string>

namespace zal::testing {

/// Time of all processors together that the machine below this one had for others while something here
/// wanted to run: "steal" in proc(5), in steps of a hundredth of a second; none on bare metal.
class WithheldTime {
 public:
  WithheldTime();
  /// Since the object was made: "in 372 s the host withheld 8230 ms of processor time".
  [[nodiscard]] std::string text() const;

 private:
  const std::chrono::steady_clock::time_point _began;
  const std::chrono::milliseconds _before;
};

}  // namespace zal::testing
