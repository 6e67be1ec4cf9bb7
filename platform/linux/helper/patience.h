#pragma once

#include <poll.h>

#include <chrono>
#include <span>
#include <string>

#include "platform/linux/files/descriptor.h"

namespace zal::helper {

using SteadyMoment = std::chrono::steady_clock::time_point;

/// How long a helper program may go on: until its time is up or somebody tells it to end. From its
/// making on SIGTERM, SIGINT, SIGHUP and SIGQUIT no longer end the process but are seen here, so that
/// every way out goes through the guards of what is half done. Made once, on the only thread.
class Patience {
 public:
  /// Throws std::system_error when the kernel has no descriptor to give.
  explicit Patience(std::chrono::milliseconds whole);

  /// Looks, never waits. Once over, always over.
  [[nodiscard]] bool isOver();
  /// Why it is over, in half a sentence; empty while it is not.
  [[nodiscard]] const std::string& reason() const { return _reason; }
  /// Waits until one of the descriptors has something (as poll() tells, in `revents`), that moment has
  /// come, or it is over. Returned: whether one has.
  bool await(std::span<pollfd> descriptors, SteadyMoment until);
  /// Waits for nothing but the moment and the end.
  void pause(std::chrono::milliseconds length);

 private:
  SteadyMoment _end;
  std::chrono::milliseconds _whole;
  Descriptor _signals;
  std::string _reason;
};

/// The milliseconds that poll() takes: rounded up, zero when the moment is past.
[[nodiscard]] int pollLimit(SteadyMoment until);

}  // namespace zal::helper
