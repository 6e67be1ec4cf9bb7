#pragma once

#include <functional>
#include <memory>

#include <asio/io_context.hpp>

#include "platform/linux/loop/descriptor_watcher.h"

namespace zal {

/// On the main run loop, which outlives it and its watches.
class LoopDescriptorWatcher : public DescriptorWatcher {
 public:
  explicit LoopDescriptorWatcher(asio::io_context& context) : _context(context) {}
  [[nodiscard]] std::unique_ptr<DescriptorWatch> watch(int descriptor,
                                                       std::function<void()> onReady) override;

 private:
  asio::io_context& _context;
};

}  // namespace zal
