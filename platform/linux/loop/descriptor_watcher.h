#pragma once

#include <functional>
#include <memory>

namespace zal {

/// One descriptor that somebody else owns, looked at by the main loop. Main thread only; no handler
/// runs after its end.
class DescriptorWatch {
 public:
  virtual ~DescriptorWatch() = default;
  /// Runs the handler once when the descriptor is ready for any of these, or broken. Replaces what was
  /// awaited before; with neither, nothing is.
  virtual void await(bool readable, bool writable) = 0;
};

/// Lets code that knows no loop have its descriptors looked at. Main thread only.
class DescriptorWatcher {
 public:
  virtual ~DescriptorWatcher() = default;
  /// The descriptor stays open while the watch lives. Throws std::system_error where none can be had.
  [[nodiscard]] virtual std::unique_ptr<DescriptorWatch> watch(int descriptor,
                                                               std::function<void()> onReady) = 0;
};

}  // namespace zal
