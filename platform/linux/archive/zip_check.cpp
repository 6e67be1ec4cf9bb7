#include "platform/linux/archive/zip_check.h"

#include <fcntl.h>
#include <isa-l.h>
#include <unistd.h>
#include <unzip.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <exception>
#include <memory>
#include <mutex>
#include <optional>
#include <vector>

#include "platform/linux/archive/worker_threads.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

constexpr std::size_t kInput = 128U << 10U;
constexpr std::size_t kOutput = 256U << 10U;
constexpr uLong kDeflated = 8;
/// From here on an entry is worth being begun early, so that no thread is left with it at the end.
constexpr std::uint64_t kLarge = 4U << 20U;

using Archive = std::unique_ptr<void, int (*)(void*)>;

Archive openArchive(const std::string& path) { return {::unzOpen64(path.c_str()), &::unzClose}; }

struct Entry {
  unz64_file_pos place{};
  std::uint64_t size = 0;
};

/// Unpacks entries of one archive, with its own view of the file.
class Unpacker {
 public:
  explicit Unpacker(const std::string& path)
      : _archive(openArchive(path)), _file(::open(path.c_str(), O_RDONLY | O_CLOEXEC)) {
    if (_archive != nullptr) rewind();
  }

  [[nodiscard]] bool isOpen() const { return _archive != nullptr && _file.isOpen(); }

  void rewind() { ::unzGoToFirstFile(_archive.get()); }
  /// The entry after `steps` more in the directory, from where this one stands.
  bool advance(std::uint64_t steps) {
    for (; steps > 0; --steps) {
      if (::unzGoToNextFile(_archive.get()) != UNZ_OK) return false;
    }
    return true;
  }
  bool goTo(const Entry& entry) { return ::unzGoToFilePos64(_archive.get(), &entry.place) == UNZ_OK; }
  [[nodiscard]] std::uint64_t sizeHere() {
    unz_file_info64 information{};
    ::unzGetCurrentFileInfo64(_archive.get(), &information, nullptr, 0, nullptr, 0, nullptr, 0);
    return information.uncompressed_size;
  }
  [[nodiscard]] unz64_file_pos placeHere() {
    unz64_file_pos place{};
    ::unzGetFilePos64(_archive.get(), &place);
    return place;
  }

  /// What is wrong with the entry that this stands at, empty when nothing is.
  std::string check() {
    unz_file_info64 information{};
    std::string name(256, '\0');
    if (::unzGetCurrentFileInfo64(_archive.get(), &information, name.data(), name.size(), nullptr, 0, nullptr,
                                  0) != UNZ_OK) {
      return "an entry of its directory cannot be read";
    }
    name.resize(std::min<std::size_t>(name.size(), information.size_filename));
    int method = 0;
    // Compares the entry's own header with the directory as well.
    if (::unzOpenCurrentFile2(_archive.get(), &method, nullptr, 1) != UNZ_OK) {
      return '"' + name + "\" has a header that does not fit";
    }
    const std::uint64_t begin = ::unzGetCurrentFileZStreamPos64(_archive.get());
    const bool fits = information.compression_method == kDeflated
                          ? _inflate(begin, information.compressed_size, information.uncompressed_size)
                          : information.compressed_size == information.uncompressed_size &&
                                _readStored(begin, information.compressed_size);
    ::unzCloseCurrentFile(_archive.get());
    if (_error) return '"' + name + "\" cannot be read: " + _error.message();
    if (!fits) return '"' + name + "\" cannot be unpacked";
    return _crc == information.crc ? "" : '"' + name + "\" has a wrong checksum";
  }

 private:
  /// The next bytes of the entry; none when the file ends or fails.
  std::size_t _read(std::uint64_t position, std::uint64_t limit) {
    const auto size = static_cast<std::size_t>(std::min<std::uint64_t>(limit, kInput));
    for (;;) {
      const ssize_t got = ::pread(_file.get(), _input.get(), size, static_cast<off_t>(position));
      if (got < 0 && errno == EINTR) continue;
      if (got < 0) _error = lastSystemError();
      return got > 0 ? static_cast<std::size_t>(got) : 0;
    }
  }

  bool _readStored(std::uint64_t position, std::uint64_t size) {
    _crc = 0;
    while (size > 0) {
      const std::size_t got = _read(position, size);
      if (got == 0) return false;
      _crc = ::crc32_gzip_refl(_crc, _input.get(), got);
      position += got;
      size -= got;
    }
    return true;
  }

  bool _inflate(std::uint64_t position, std::uint64_t packed, std::uint64_t size) {
    _crc = 0;
    ::isal_inflate_init(_state.get());
    _state->avail_in = 0;
    std::uint64_t unpacked = 0;
    while (_state->block_state != ISAL_BLOCK_FINISH) {
      if (_state->avail_in == 0 && packed > 0) {
        const std::size_t got = _read(position, packed);
        if (got == 0) return false;
        _state->next_in = _input.get();
        _state->avail_in = static_cast<std::uint32_t>(got);
        position += got;
        packed -= got;
      }
      _state->next_out = _output.get();
      _state->avail_out = kOutput;
      const std::uint32_t before = _state->avail_in;
      const int result = ::isal_inflate(_state.get());
      if (result < 0) return false;
      const std::size_t got = kOutput - _state->avail_out;
      _crc = ::crc32_gzip_refl(_crc, _output.get(), got);
      unpacked += got;
      // Bytes are still to come, but there are none.
      if (got == 0 && before == _state->avail_in && packed == 0 && _state->block_state != ISAL_BLOCK_FINISH) {
        return false;
      }
    }
    return packed == 0 && _state->avail_in == 0 && unpacked == size;
  }

  const Archive _archive;
  const Descriptor _file;
  const std::unique_ptr<inflate_state> _state = std::make_unique<inflate_state>();
  const std::unique_ptr<unsigned char[]> _input{new unsigned char[kInput]};
  const std::unique_ptr<unsigned char[]> _output{new unsigned char[kOutput]};
  std::uint32_t _crc = 0;
  std::error_code _error;
};

class ArchiveCheck {
 public:
  ArchiveCheck(std::string path, std::uint64_t entries) : _path(std::move(path)), _entries(entries) {}

  std::string run() {
    Unpacker first(_path);
    if (!first.isOpen()) return "its directory cannot be read";
    if (!_listLarge(first)) return "its directory does not have " + std::to_string(_entries) + " entries";
    {
      const WorkerThreads threads(archiveThreads(), [this](std::size_t) { _work(); });
    }
    const std::scoped_lock lock(_mutex);
    return _wrong;
  }

 private:
  /// Finds the large entries, the largest first. Returned: whether there are as many as there should be.
  bool _listLarge(Unpacker& unpacker) {
    for (std::uint64_t at = 0; at < _entries; ++at) {
      if (at > 0 && !unpacker.advance(1)) return false;
      if (const std::uint64_t size = unpacker.sizeHere(); size >= kLarge) {
        _large.push_back({unpacker.placeHere(), size});
      }
    }
    std::sort(_large.begin(), _large.end(), [](const Entry& a, const Entry& b) { return a.size > b.size; });
    return _entries == 0 || !unpacker.advance(1);
  }

  void _work() try {
    Unpacker unpacker(_path);
    if (!unpacker.isOpen()) return _note("it cannot be opened again");
    for (std::size_t i = 0; (i = _nextLarge++) < _large.size();) {
      if (!unpacker.goTo(_large[i])) return _note("its directory cannot be read");
      _note(unpacker.check());
    }
    unpacker.rewind();
    std::uint64_t here = 0;
    for (std::uint64_t i = 0; (i = _next++) < _entries && !_hasWrong();) {
      if (!unpacker.advance(i - here)) return _note("its directory cannot be read");
      here = i;
      if (unpacker.sizeHere() < kLarge) _note(unpacker.check());
    }
  } catch (const std::exception& error) {
    _note(error.what());
  }

  void _note(std::string wrong) {
    if (wrong.empty()) return;
    const std::scoped_lock lock(_mutex);
    if (_wrong.empty()) _wrong = std::move(wrong);
  }
  bool _hasWrong() {
    const std::scoped_lock lock(_mutex);
    return !_wrong.empty();
  }

  const std::string _path;
  const std::uint64_t _entries;
  std::vector<Entry> _large;
  std::atomic<std::size_t> _nextLarge{0};
  std::atomic<std::uint64_t> _next{0};
  std::mutex _mutex;
  std::string _wrong;  // guarded by _mutex; the first found
};

}  // namespace

std::string checkZipArchive(const std::string& archive, std::uint64_t entries) {
  try {
    return ArchiveCheck(archive, entries).run();
  } catch (const std::exception& error) {
    return error.what();
  }
}

}  // namespace zal
