#include "platform/linux/archive/zip_archive.h"

#include <zlib.h>

#include <algorithm>
#include <array>
#include <ctime>
#include <deque>
#include <exception>
#include <filesystem>
#include <memory>
#include <optional>
#include <set>
#include <system_error>
#include <utility>

#include <sys/stat.h>
#include <unistd.h>

#include "platform/linux/archive/archive_output.h"
#include "platform/linux/archive/chunk_pipeline.h"
#include "platform/linux/archive/tree_walk.h"
#include "platform/linux/archive/zip_container.h"
#include "platform/linux/files/file_copy.h"
#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

/// Entries without content that may wait behind a file that is being compressed.
constexpr std::size_t kMostWaiting = 256;
/// Places of a large file that are tried before it is decided whether to compress it.
constexpr std::uint64_t kTrialPlaces = 4;
/// Lines about what was left out that the ending gets to know.
constexpr std::size_t kMostRemarks = 1000;

std::uint64_t chunksOf(std::uint64_t size) { return (size + kChunkSize - 1) / kChunkSize; }

/// The walk gives entries, their files go through the pipeline as chunks, and what comes out goes into
/// the container, all in one order.
class ArchiveWriter {
 public:
  using Line = std::function<void(const std::string&)>;
  ArchiveWriter(ArchiveOutput& output, ArchiveCompression compression, const ArchiveEnding& ending,
                const Line& line)
      : _output(output), _ending(ending), _line(line), _container(output), _pipeline(compression) {}

  /// A line for what is left out or cut.
  void remark(const std::string& line) {
    _line(line);
    if (_ending.text && _content.remarks.size() < kMostRemarks) _content.remarks.push_back(line);
  }

  /// Whether a file could not be read to its end, other than because it became shorter.
  [[nodiscard]] bool hasMissed() const { return _hasMissed; }

  std::uint64_t write(TreeWalk& walk) {
    while (std::optional<FoundEntry> found = walk.next()) {
      while (_waiting.size() >= kMostWaiting) _writeOldest();
      const struct stat& status = found->entry.status;
      if (found->file.isOpen() && _output.is(status.st_dev, status.st_ino)) continue;  // the archive itself
      _add(std::move(*found));
    }
    while (!_waiting.empty()) _writeOldest();
    if (_ending.text) {
      _addText(_top + _freeName(), _ending.text(_content));
      while (!_waiting.empty()) _writeOldest();
    }
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
    std::shared_ptr<FileHash> hash;
  };

  void _add(FoundEntry found) {
    if (_top.empty()) _top = found.entry.name;
    _noteName(std::string_view(found.entry.name).substr(_top.size()));
    Waiting waiting{std::move(found.entry), std::move(found.path), std::move(found.link), 0, 0, nullptr};
    if (!found.file.isOpen()) {
      _waiting.push_back(std::move(waiting));
      return;
    }
    waiting.size = static_cast<std::uint64_t>(waiting.entry.status.st_size);
    waiting.chunks = chunksOf(waiting.size);
    if (_ending.text && waiting.chunks > 0) waiting.hash = std::make_shared<FileHash>();
    ChunkTask task;
    task.file = std::make_shared<const Descriptor>(std::move(found.file));
    task.hash = waiting.hash;
    task.method =
        waiting.chunks > 1 && !_shrinks(*task.file, waiting.size) ? ZipMethod::stored : ZipMethod::deflated;
    _giveChunks(std::move(waiting), std::move(task));
  }

  /// A text as a file that lies nowhere: no disk can fail while it is read.
  void _addText(std::string name, std::string text) {
    Waiting waiting;
    waiting.path = waiting.entry.name = std::move(name);
    waiting.entry.status.st_mode = S_IFREG | S_IRUSR | S_IWUSR | S_IRGRP | S_IROTH;
    waiting.entry.status.st_mtime = ::time(nullptr);
    waiting.size = text.size();
    waiting.chunks = chunksOf(waiting.size);
    ChunkTask task;
    task.text = std::make_shared<const std::string>(std::move(text));
    _giveChunks(std::move(waiting), std::move(task));
  }

  void _giveChunks(Waiting waiting, ChunkTask task) {
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
      if (!oldest.entry.name.ends_with('/')) _noteFile(oldest, oldest.link.size(), _sha256Of(oldest.link));
      _waiting.pop_front();
      return;
    }
    const ChunkResult& result = _pipeline.oldest();
    if (!_current.ended) _writeChunk(oldest, result);
    _pipeline.dropOldest();
    if (++_current.chunk < oldest.chunks) return;
    if (_current.begun) {
      _endEntry();
      _noteFile(oldest, _current.size, oldest.hash ? oldest.hash->takeDigest() : "");
    }
    _current = {};
    _waiting.pop_front();
  }

  void _writeChunk(const Waiting& waiting, const ChunkResult& result) {
    if (result.error) _hasMissed = true;
    if (result.error && result.read == 0 && !_current.begun) {
      remark('"' + waiting.path + "\" is left out of the archive: " + result.error.message());
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
    remark('"' + waiting.path + "\" is cut in the archive after " + std::to_string(_current.size) + " of " +
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

  std::string _sha256Of(const std::string& text) {
    if (!_ending.text) return "";
    _hash.add(text.data(), text.size());
    return _hash.takeDigest();
  }
  void _noteFile(const Waiting& waiting, std::uint64_t bytes, std::string sha256) {
    if (!_ending.text) return;
    _content.files.push_back(
        {waiting.entry.name.substr(_top.size()), bytes, std::move(sha256), bytes != _sizeOf(waiting)});
  }
  static std::uint64_t _sizeOf(const Waiting& waiting) {
    return waiting.chunks > 0 ? waiting.size : waiting.link.size();
  }
  void _noteName(std::string_view below) {
    if (_ending.text && below.starts_with(_ending.name)) _taken.emplace(below.substr(0, below.find('/')));
  }
  std::string _freeName() const {
    std::string name = _ending.name;
    for (int number = 2; _taken.count(name) != 0; ++number)
      name = _ending.name + '-' + std::to_string(number);
    return name;
  }

  ArchiveOutput& _output;
  const ArchiveEnding& _ending;
  const Line& _line;
  std::string _top;              // the first entry: that of the directory
  std::set<std::string> _taken;  // names below it that the ending's may have to make way for
  ArchiveContent _content;
  Sha256 _hash;
  ZipContainer _container;
  CompressionTrial _trial;
  bool _hasMissed = false;
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
                               ArchiveCompression compression, const ArchiveEnding& ending,
                               const std::function<void(const std::string&)>& line,
                               const RootedPaths& paths) {
  ArchiveOutcome outcome;
  try {
    // The walk is there before the output is made, and what it leaves out at its beginning waits so long.
    std::vector<std::string> early;
    ArchiveWriter* writer = nullptr;
    const auto leftOut = [&](const std::string& text) {
      writer != nullptr ? writer->remark(text) : early.push_back(text);
    };
    TreeWalk walk(paths, directory, leftOut, line);
    ArchiveOutput file(output);
    outcome.outputIsOurs = file.isMade();
    if (file.error()) throw std::system_error(file.error(), output);
    ArchiveWriter archive(file, compression, ending, line);
    for (const std::string& text : early) archive.remark(text);
    writer = &archive;
    outcome.entries = archive.write(walk);
    outcome.hasMissed = walk.hasMissed() || archive.hasMissed();
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
