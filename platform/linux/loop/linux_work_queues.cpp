#include "platform/linux/loop/linux_work_queues.h"

#include <utility>

#include <asio/strand.hpp>

namespace zal {

namespace {

// Jobs wait for shell commands now and then; a few threads keep the others going meanwhile.
constexpr std::size_t kStandardThreads = 4;
constexpr std::size_t kBackgroundThreads = 2;

class MainQueue : public WorkQueue {
 public:
  explicit MainQueue(RunLoop& loop) : _loop(loop) {}
  [[nodiscard]] const std::string& label() const override { return _label; }
  void async(Job job) override { _loop.post(std::move(job)); }
  void asyncAfter(std::chrono::nanoseconds delay, Job job) override {
    // Timers of the loop are made on its own thread only.
    _loop.post(
        [&loop = _loop, delay, job = std::move(job)]() mutable { loop.callAfter(delay, std::move(job)); });
  }

 private:
  RunLoop& _loop;
  const std::string _label = "main";
};

class PoolQueue : public WorkQueue {
 public:
  PoolQueue(std::shared_ptr<ThreadPool> pool, asio::any_io_executor executor, std::string label)
      : _pool(std::move(pool)), _executor(std::move(executor)), _label(std::move(label)) {}
  [[nodiscard]] const std::string& label() const override { return _label; }
  void async(Job job) override { _pool->submit(_executor, _label, std::move(job)); }
  void asyncAfter(std::chrono::nanoseconds delay, Job job) override {
    _pool->submitAfter(delay, _executor, _label, std::move(job));
  }

 private:
  const std::shared_ptr<ThreadPool> _pool;  // before the executor, which may not outlive it
  const asio::any_io_executor _executor;
  const std::string _label;
};

}  // namespace

LinuxWorkQueues::LinuxWorkQueues(RunLoop& loop, FailureHandler onFailure)
    : _standardPool(std::make_shared<ThreadPool>(
          ThreadPool::Options{"zal-work", kStandardThreads, QueuePriority::standard}, onFailure)),
      _backgroundPool(std::make_shared<ThreadPool>(
          ThreadPool::Options{"zal-idle", kBackgroundThreads, QueuePriority::background},
          std::move(onFailure))),
      _main(std::make_unique<MainQueue>(loop)),
      _standard(std::make_unique<PoolQueue>(_standardPool, _standardPool->executor(), "global.default")),
      _background(
          std::make_unique<PoolQueue>(_backgroundPool, _backgroundPool->executor(), "global.background")) {}

LinuxWorkQueues::~LinuxWorkQueues() {
  _standardPool->close();
  _backgroundPool->close();
}

WorkQueue& LinuxWorkQueues::main() { return *_main; }

WorkQueue& LinuxWorkQueues::global(QueuePriority priority) {
  return priority == QueuePriority::background ? *_background : *_standard;
}

std::unique_ptr<WorkQueue> LinuxWorkQueues::makeSerial(std::string label, QueuePriority priority) {
  const auto& pool = priority == QueuePriority::background ? _backgroundPool : _standardPool;
  return std::make_unique<PoolQueue>(pool, asio::make_strand(pool->executor()), std::move(label));
}

}  // namespace zal
