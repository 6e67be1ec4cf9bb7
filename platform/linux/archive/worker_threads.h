#pragma once

#include <cstddef>
#include <functional>
#include <thread>
#include <vector>

namespace zal {

/// How many threads an archive is worked on with: one for each processor, four at most, as more would
/// cost memory and only wait for the disk.
[[nodiscard]] std::size_t archiveThreads();

/// Threads that do one thing side by side and are joined at the end. They run at nice 10: nothing else to
/// do, they have the whole machine, but a call in progress or the screen gets its processor first.
/// Not lower, because an archive that a person waits for should still come soon on a busy device.
class WorkerThreads {
 public:
  /// Makes do with fewer when the host does not give as many; throws std::system_error when it gives
  /// none. `work` gets the thread's number, from 0, and must not throw.
  WorkerThreads(std::size_t count, const std::function<void(std::size_t)>& work);
  ~WorkerThreads() { join(); }
  WorkerThreads(const WorkerThreads&) = delete;
  WorkerThreads& operator=(const WorkerThreads&) = delete;
  void join();

 private:
  std::vector<std::thread> _threads;
};

}  // namespace zal
