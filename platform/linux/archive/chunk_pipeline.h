#pragma once

#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <memory>
#include <mutex>
#include <string>
#include <system_error>
#include <vector>

#include "platform/configuration.h"
#include "platform/linux/archive/chunk_compressor.h"
#include "platform/linux/archive/file_hash.h"
#include "platform/linux/archive/worker_threads.h"
#include "platform/linux/archive/zip_container.h"
#include "platform/linux/files/descriptor.h"

namespace zal {

/// A part of a file, or of a text, to read and compress.
struct ChunkTask {
  std::shared_ptr<const Descriptor> file;
  std::shared_ptr<const std::string> text;  ///< instead of a file
  std::uint64_t offset = 0;
  std::size_t size = 0;                    ///< 1 to kChunkSize
  bool first = true, last = true;          ///< of its file
  ZipMethod method = ZipMethod::deflated;  ///< a file of one chunk is stored all the same if that is shorter
  std::shared_ptr<FileHash> hash;          ///< of its file; empty: nobody asks for it
};

/// What became of it.
struct ChunkResult {
  ZipMethod method = ZipMethod::stored;
  const char* bytes = nullptr;  ///< for the archive, until the result is dropped
  std::size_t size = 0;
  std::size_t read = 0;   ///< less than asked for: the file ends here now, or `error` says why
  std::uint32_t crc = 0;  ///< of what was read
  bool endsStream = false;
  std::error_code error;
};

/// Reads and compresses chunks on several threads and hands out the results in the order of the tasks.
/// Takes so many tasks only as it has room for results. One thread at a time gives and takes.
class ChunkPipeline {
 public:
  /// Throws std::bad_alloc and std::system_error.
  explicit ChunkPipeline(ArchiveCompression compression);
  /// Waits for the tasks that are being worked on; those not begun are dropped.
  ~ChunkPipeline();
  ChunkPipeline(const ChunkPipeline&) = delete;
  ChunkPipeline& operator=(const ChunkPipeline&) = delete;

  [[nodiscard]] bool isFull() const { return _given - _dropped == _slots.size(); }
  /// Not when it is full.
  void give(ChunkTask task);
  /// The oldest result, waited for if need be. Only when a task was given and its result not dropped.
  [[nodiscard]] const ChunkResult& oldest();
  void dropOldest();

 private:
  struct Slot {
    ChunkTask task;
    ChunkResult result;
    std::unique_ptr<char[]> output;
    bool done = false;
  };
  class Worker;
  void _work(Worker& worker);

  std::vector<Slot> _slots;  // used in turn
  std::vector<std::unique_ptr<Worker>> _workers;
  std::mutex _mutex;
  std::condition_variable _taskGiven, _resultDone;
  // The numbers of tasks so far; guarded by _mutex where a worker reads them.
  std::uint64_t _given = 0, _taken = 0, _dropped = 0;
  bool _ending = false;
  std::unique_ptr<WorkerThreads> _threads;  // last: they use all of the above
};

}  // namespace zal
