#include "platform/linux/process/queueing_shell.h"

#include <chrono>

namespace zal {
namespace {

constexpr std::chrono::seconds kPatienceAtTheEnd{5};

}  // namespace

QueueingShell::QueueingShell(SystemShell& shell, WorkQueues& queues) : _shell(shell), _queues(queues) {}

// Queued lines would find nobody.
QueueingShell::~QueueingShell() { startWhatIsQueued(); }

int QueueingShell::PerformSystem(const std::string& commandLine) { return _shell.PerformSystem(commandLine); }

void QueueingShell::performSystemInBackground(const std::string& commandLine) {
  if (std::this_thread::get_id() != _spared) {
    _shell.performSystemInBackground(commandLine);
    return;
  }
  if (!_queue) _queue = _queues.makeSerial("com.vendel.lirra.shellqueue");
  {
    const std::scoped_lock lock(_lock);
    ++_waiting;
  }
  _queue->async([this, commandLine] {
    _shell.performSystemInBackground(commandLine);
    _started();
  });
}

void QueueingShell::_started() {
  const std::scoped_lock lock(_lock);
  if (--_waiting == 0) _allStarted.notify_all();
}

void QueueingShell::startWhatIsQueued() {
  std::unique_lock lock(_lock);
  _allStarted.wait_for(lock, kPatienceAtTheEnd, [this] { return _waiting == 0; });
}

}  // namespace zal
