#include "platform/linux/loop/loop_descriptor_watcher.h"

#include <fcntl.h>

#include <cerrno>
#include <system_error>
#include <utility>

#include <asio/posix/stream_descriptor.hpp>

#include "platform/main_thread_watch.h"

namespace zal {
namespace {

class LoopDescriptorWatch : public DescriptorWatch {
 public:
  LoopDescriptorWatch(asio::io_context& context, int descriptor, std::function<void()> onReady)
      : _descriptor(context), _onReady(std::make_shared<std::function<void()>>(std::move(onReady))) {
    // One of its own: the loop closes what it looked at, and the owner closes what it owns.
    const int own = ::fcntl(descriptor, F_DUPFD_CLOEXEC, 3);
    if (own < 0) throw std::system_error(errno, std::generic_category(), "a descriptor to look at");
    _descriptor.assign(own);
  }

  void await(bool readable, bool writable) override {
    if (readable == _awaitsReadable && writable == _awaitsWritable) return;
    if ((_awaitsReadable && !readable) || (_awaitsWritable && !writable)) {
      _descriptor.cancel();
      ++_round;
      _awaitsReadable = _awaitsWritable = false;
    }
    if (readable && !std::exchange(_awaitsReadable, true)) {
      _arm(asio::posix::descriptor_base::wait_read, _awaitsReadable);
    }
    if (writable && !std::exchange(_awaitsWritable, true)) {
      _arm(asio::posix::descriptor_base::wait_write, _awaitsWritable);
    }
  }

 private:
  void _arm(asio::posix::descriptor_base::wait_type what, bool& awaited) {
    _descriptor.async_wait(what, [this, &awaited, round = _round,
                                  onReady = std::weak_ptr(_onReady)](const std::error_code& error) {
      const auto handler = onReady.lock();
      if (error == asio::error::operation_aborted || !handler || round != _round) return;
      awaited = false;
      const MainThreadWatch::Span span("descriptor", handler->target_type().name());
      (*handler)();
    });
  }

  asio::posix::stream_descriptor _descriptor;
  bool _awaitsReadable = false, _awaitsWritable = false;
  unsigned _round = 0;                              // of waits: cancelled ones belong to an earlier one
  std::shared_ptr<std::function<void()>> _onReady;  // dies first: guards handlers in flight
};

}  // namespace

std::unique_ptr<DescriptorWatch> LoopDescriptorWatcher::watch(int descriptor, std::function<void()> onReady) {
  return std::make_unique<LoopDescriptorWatch>(_context, descriptor, std::move(onReady));
}

}  // namespace zal
