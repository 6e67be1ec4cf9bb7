#include "platform/linux/archive/zip_archive.h"

#include <zlib.h>

#include <array>
#include <deque>
#include <exception>
#include <filesystem>
#include <memory>
#include <optional>
#include <system_error>
#include <utility>

#include <unistd.h>

#include "platform/linux/archive/archive_output.h"
#include "platform/linux/archive/chunk_pipeline.h"
#include "platform/linux/archive/tree_walk.h"
#include "platform/linux/archive/zip_container.h"
#include "platform/linux/files/file_copy.h"

namespace zal {
namespace {

/// Entries without content that may wait behind a file that is being compressed.
constexpr std::size_t kMostWaiting = 256;
/// Places of a large file that are tried before it is decided whether to compress it.
constexpr std::uint64_t kTrialPlaces = 4;

/// The walk gives entries, their files go through the pipeline as chunks, and what comes out goes into
/// the container, all in one order.
class ArchiveWriter {
 public:
  using Line = std::function<void(const std::string&)>;
  ArchiveWriter(ArchiveOutput& output, ArchiveCompression compression, const Line& line)
      : _output(output), _line(line), _container(output), _pipeline(compression) {}

  std::uint64_t write(TreeWalk& walk) {
    while (std::optional<FoundEntry> found = walk.next()) {
      while (_waiting.size() >= kMostWaiting) _writeOldest();
      const struct stat& status = found->entry.status;
      if (found->file.isOpen() && _output.is(status.st_dev, status.st_ino)) continue;  // the archive itself
      _add(std::move(*found));
    }
    while (!_waiting.empty()) _writeOldest();
    _container.finish();
    return _container.entries();
  }

 private:
  /// An entry on its way into the archive, with the tasks that its content takes.
  struct Waiting {
    ArchiveEntry entry;
    std::string path, link;
    std::uint64_t size = 0;
    std::uint64_t chunks = 0;
  };

  void _add(FoundEntry found) {
    Waiting waiting{std::move(found.entry), std::move(found.path), std::move(found.link)};
    if (!found.file.isOpen()) {
      _waiting.push_back(std::move(waiting));
      return;
    }
    waiting.size = static_cast<std::uint64_t>(waiting.entry.status.st_size);
    waiting.chunks = (waiting.size + kChunkSize - 1) / kChunkSize;
    const auto file = std::make_shared<const Descriptor>(std::move(found.file));
    ChunkTask task{file};
    task.method =
        waiting.chunks > 1 && !_shrinks(*file, waiting.size) ? ZipMethod::stored : ZipMethod::deflated;
    const std::uint64_t size = waiting.size;
    _waiting.push_back(std::move(waiting));
    for (; task.offset < size; task.offset += kChunkSize) {
      while (_pipeline.isFull()) _writeOldest();
      task.size = static_cast<std::size_t>(std::min<std::uint64_t>(kChunkSize, size - task.offset));
      task.first = task.offset == 0;
      task.last = task.offset + task.size == size;
      _pipeline.give(task);
    }
  }

  bool _shrinks(const Descriptor& file, std::uint64_t size) {
    std::array<char, CompressionTrial::kSample> sample{};
    for (std::uint64_t place = 0; place < kTrialPlaces; ++place) {
      const ssize_t got = ::pread(file.get(), sample.data(), sample.size(),
                                  static_cast<off_t>(size / kTrialPlaces * place + size / kTrialPlaces / 2));
      if (got <= 0) return true;
      if (_trial.share(sample.data(), static_cast<std::size_t>(got)) < CompressionTrial::kHardlyShrinks)
        return true;
    }
    return false;
  }

  /// One step: the oldest entry whole when it has no content, else its next chunk.
  void _writeOldest() {
    const Waiting& oldest = _waiting.front();
    if (oldest.chunks == 0) {
      _container.beginEntry(oldest.entry, ZipMethod::stored, 0);
      if (!oldest.link.empty()) _container.write(oldest.link.data(), oldest.link.size());
      _container.endEntry(oldest.link.size(), _crcOf(oldest.link));
      _waiting.pop_front();
      return;
    }
    const ChunkResult& result = _pipeline.oldest();
    if (!_current.ended) _writeChunk(oldest, result);
    _pipeline.dropOldest();
    if (++_current.chunk < oldest.chunks) return;
    if (_current.begun) _endEntry();
    _current = {};
    _waiting.pop_front();
  }

  void _writeChunk(const Waiting& waiting, const ChunkResult& result) {
    if (result.error && result.read == 0 && !_current.begun) {
      _line('"' + waiting.path + "\" is left out of the archive: " + result.error.message());
      _current.ended = true;
      return;
    }
    if (!_current.begun) {
      _container.beginEntry(waiting.entry, result.method, waiting.size);
      _current.begun = true;
      _current.method = result.method;
    }
    if (result.size > 0) _container.write(result.bytes, result.size);
    _current.crc = static_cast<std::uint32_t>(
        ::crc32_combine(_current.crc, result.crc, static_cast<z_off_t>(result.read)));
    _current.size += result.read;
    _current.streamEnded = result.endsStream;
    // Files are cut at the size that they had; one that has become shorter ends with what was read.
    const std::uint64_t expected = std::min<std::uint64_t>(waiting.size, (_current.chunk + 1) * kChunkSize);
    if (_current.size == expected) return;
    _current.ended = true;
    _line('"' + waiting.path + "\" is cut in the archive after " + std::to_string(_current.size) + " of " +
          std::to_string(waiting.size) + " bytes: " +
          (result.error ? result.error.message() : std::string("it became shorter while it was read")));
  }

  void _endEntry() {
    constexpr std::string_view kEmptyLastBlock("\x03\x00", 2);
    if (_current.method == ZipMethod::deflated && !_current.streamEnded) {
      _container.write(kEmptyLastBlock.data(), kEmptyLastBlock.size());
    }
    _container.endEntry(_current.size, _current.crc);
  }

  static std::uint32_t _crcOf(const std::string& text) {
    return static_cast<std::uint32_t>(
        ::crc32(0, reinterpret_cast<const unsigned char*>(text.data()), static_cast<unsigned>(text.size())));
  }

  ArchiveOutput& _output;
  const Line& _line;
  ZipContainer _container;
  CompressionTrial _trial;
  std::deque<Waiting> _waiting;
  struct {
    std::uint64_t chunk = 0, size = 0;
    std::uint32_t crc = 0;
    ZipMethod method = ZipMethod::stored;
    bool begun = false, streamEnded = false;
    bool ended = false;  // what still comes of the file is not wanted
  } _current;
  ChunkPipeline _pipeline;
};

}  // namespace

ArchiveOutcome writeZipArchive(const std::string& directory, const std::string& output,
                               ArchiveCompression compression,
                               const std::function<void(const std::string&)>& line) {
  ArchiveOutcome outcome;
  try {
    TreeWalk walk(directory, line);
    ArchiveOutput file(output);
    outcome.outputIsOurs = file.isMade();
    if (file.error()) throw std::system_error(file.error(), output);
    outcome.entries = ArchiveWriter(file, compression, line).write(walk);
    file.sync();
    if (file.error()) throw std::system_error(file.error());
    // The archive's name as well; some file systems refuse, and it is there all the same.
    [[maybe_unused]] const auto refused = syncDirectory(std::filesystem::path(output).parent_path().string());
  } catch (const std::exception& error) {
    outcome.failure = error.what();
  }
  return outcome;
}

}  // namespace zal
