#include "tests/support/manual_work_queues.h"

#include <algorithm>

namespace zal::testing {

class ManualWorkQueues::Queue : public WorkQueue {
 public:
  Queue(ManualWorkQueues& owner, std::string label, bool isMain)
      : _owner(owner), _label(std::move(label)), _isMain(isMain) {}
  [[nodiscard]] const std::string& label() const override { return _label; }
  void async(Job job) override {
    if (_isMain) {
      _owner._loop.post(std::move(job));
      return;
    }
    const std::scoped_lock lock(_owner._mutex);
    _owner._ready.push_back({_label, std::move(job)});
  }
  void asyncAfter(std::chrono::nanoseconds delay, Job job) override {
    _owner._loop.callAfter(delay, [owner = &_owner, label = _label, isMain = _isMain, job = std::move(job)] {
      if (isMain) {
        job();
        return;
      }
      const std::scoped_lock lock(owner->_mutex);
      owner->_ready.push_back({label, job});
    });
  }

 private:
  ManualWorkQueues& _owner;
  std::string _label;
  bool _isMain;
};

ManualWorkQueues::ManualWorkQueues(ManualRunLoop& loop)
    : _loop(loop),
      _main(std::make_unique<Queue>(*this, "main", true)),
      _default(std::make_unique<Queue>(*this, "global.default", false)),
      _background(std::make_unique<Queue>(*this, "global.background", false)) {}

ManualWorkQueues::~ManualWorkQueues() = default;

WorkQueue& ManualWorkQueues::main() { return *_main; }

WorkQueue& ManualWorkQueues::global(QueuePriority priority) {
  return priority == QueuePriority::background ? *_background : *_default;
}

std::unique_ptr<WorkQueue> ManualWorkQueues::makeSerial(std::string label, QueuePriority /*priority*/) {
  return std::make_unique<Queue>(*this, std::move(label), false);
}

bool ManualWorkQueues::runNext(const std::string& label) {
  WorkQueue::Job job;
  {
    const std::scoped_lock lock(_mutex);
    const auto found =
        std::find_if(_ready.begin(), _ready.end(), [&](const Ready& ready) { return ready.label == label; });
    if (found == _ready.end()) return false;
    job = std::move(found->job);
    _ready.erase(found);
  }
  job();
  return true;
}

void ManualWorkQueues::runAll() {
  for (;;) {
    _loop.drain();
    WorkQueue::Job job;
    {
      const std::scoped_lock lock(_mutex);
      if (_ready.empty()) break;
      job = std::move(_ready.front().job);
      _ready.pop_front();
    }
    job();
  }
}

std::size_t ManualWorkQueues::readyJobs(const std::string& label) const {
  const std::scoped_lock lock(_mutex);
  return static_cast<std::size_t>(
      std::count_if(_ready.begin(), _ready.end(), [&](const Ready& ready) { return ready.label == label; }));
}

}  // namespace zal::testing
