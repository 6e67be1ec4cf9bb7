#include "platform/linux/archive/chunk_pipeline.h"

#include <isa-l.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <string>
#include <utility>

#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

/// For each thread one result that is being made and one that waits for its turn, and one to be written.
std::size_t slotsFor(std::size_t threads) { return 2 * threads + 1; }

/// Reads until there is nothing more. Returned: the bytes read.
std::size_t readChunk(const ChunkTask& task, char* bytes, std::error_code& error) {
  if (task.text) return task.text->copy(bytes, task.size, task.offset);
  std::size_t read = 0;
  while (read < task.size) {
    const ssize_t got =
        ::pread(task.file->get(), bytes + read, task.size - read, static_cast<off_t>(task.offset + read));
    if (got < 0 && errno == EINTR) continue;
    if (got < 0) error = lastSystemError();
    if (got <= 0) break;
    read += static_cast<std::size_t>(got);
  }
  return read;
}

}  // namespace

class ChunkPipeline::Worker {
 public:
  explicit Worker(ArchiveCompression compression) : _compressor(makeChunkCompressor(compression)) {}

  void run(Slot& slot) {
    const ChunkTask& task = slot.task;
    ChunkResult& result = slot.result;
    result = {};
    result.method = task.method;
    result.bytes = slot.output.get();
    char* const input = task.method == ZipMethod::stored ? slot.output.get() : _input.get();
    result.read = readChunk(task, input, result.error);
    result.crc = ::crc32_gzip_refl(0, reinterpret_cast<const unsigned char*>(input), result.read);
    // While the bytes are at hand; when it is not this chunk's turn, packing it is a better use of the time.
    const bool hashFirst = task.hash && task.hash->isTurn(task.offset);
    if (hashFirst) task.hash->add(task.offset, input, result.read, task.size);
    if (task.method == ZipMethod::stored) {
      result.size = result.read;
    } else {
      _pack(slot, input);
    }
    if (task.hash && !hashFirst) task.hash->add(task.offset, input, result.read, task.size);
  }

 private:
  void _pack(Slot& slot, const char* input) {
    const ChunkTask& task = slot.task;
    ChunkResult& result = slot.result;
    result.endsStream = task.last;
    if (_isEmptyChunk(task, result.read)) {
      std::memcpy(slot.output.get(), _emptyChunk.data(), _emptyChunk.size());
      result.size = _emptyChunk.size();
    } else if (result.read > 1) {
      const Chunk chunk{input, result.read, task.last, _trial.chunkShare(input, result.read)};
      if (chunk.share < CompressionTrial::kHardlyShrinks) {
        result.size = _compressor->compress(chunk, slot.output.get(), result.read - 1);
      }
    }
    if (result.size > 0) return;
    if (task.first && task.last) {
      result.method = ZipMethod::stored;
      result.size = result.read;
      std::memcpy(slot.output.get(), input, result.read);
    } else {
      result.size = storeChunk(input, result.read, task.last, slot.output.get());
    }
  }
  /// Whether it is one of the chunks of zeros that sparse files are full of. They are compressed once.
  bool _isEmptyChunk(const ChunkTask& task, std::size_t read) {
    const char* const input = _input.get();
    if (task.last || read != kChunkSize || input[0] != 0 || std::memcmp(input, input + 1, read - 1) != 0) {
      return false;
    }
    if (_emptyChunk.empty()) {
      _emptyChunk.resize(kChunkSize / 8);
      _emptyChunk.resize(_compressor->compress({input, read, false}, _emptyChunk.data(), _emptyChunk.size()));
    }
    return !_emptyChunk.empty();
  }

  const std::unique_ptr<ChunkCompressor> _compressor;
  CompressionTrial _trial;
  std::string _emptyChunk;
  const std::unique_ptr<char[]> _input{new char[kChunkSize]};
};

ChunkPipeline::ChunkPipeline(ArchiveCompression compression) : _slots(slotsFor(archiveThreads())) {
  for (Slot& slot : _slots) slot.output.reset(new char[storedSize(kChunkSize)]);
  for (std::size_t i = 0; i < archiveThreads(); ++i)
    _workers.push_back(std::make_unique<Worker>(compression));
  _threads = std::make_unique<WorkerThreads>(_workers.size(),
                                             [this](std::size_t number) { _work(*_workers[number]); });
}

ChunkPipeline::~ChunkPipeline() {
  {
    const std::scoped_lock lock(_mutex);
    _ending = true;
  }
  _taskGiven.notify_all();
}

void ChunkPipeline::give(ChunkTask task) {
  {
    const std::scoped_lock lock(_mutex);
    Slot& slot = _slots[_given % _slots.size()];
    slot.task = std::move(task);
    slot.done = false;
    ++_given;
  }
  _taskGiven.notify_one();
}

const ChunkResult& ChunkPipeline::oldest() {
  std::unique_lock lock(_mutex);
  Slot& slot = _slots[_dropped % _slots.size()];
  _resultDone.wait(lock, [&] { return slot.done; });
  return slot.result;
}

void ChunkPipeline::dropOldest() {
  ChunkTask& task = _slots[_dropped % _slots.size()].task;
  task.file.reset();
  task.text.reset();
  task.hash.reset();
  ++_dropped;
}

void ChunkPipeline::_work(Worker& worker) {
  std::unique_lock lock(_mutex);
  for (;;) {
    _taskGiven.wait(lock, [this] { return _ending || _taken < _given; });
    if (_ending) return;
    Slot& slot = _slots[_taken++ % _slots.size()];
    lock.unlock();
    worker.run(slot);
    lock.lock();
    slot.done = true;
    _resultDone.notify_one();
  }
}

}  // namespace zal
