#pragma once

namespace zal {

/// One way of pinging, at work. Lives on the loop's thread. It calls the end handler that it was
/// made with exactly once: when it has nothing more to do, or after stop(), maybe inside of it.
class PingRun {
 public:
  virtual ~PingRun() = default;
  virtual void start() = 0;
  /// Ends it; what there is by then is the result.
  virtual void stop() = 0;
};

}  // namespace zal
