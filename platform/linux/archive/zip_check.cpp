#include "platform/linux/archive/zip_check.h"

#include <fcntl.h>

#include <algorithm>
#include <exception>
#include <mutex>
#include <vector>

#include "platform/linux/archive/entry_check.h"
#include "platform/linux/archive/worker_threads.h"
#include "platform/linux/archive/zip_directory.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

/// From here on an entry is worth being begun early, so that no thread is left with it at the end.
constexpr std::uint64_t kLarge = 4U << 20U;

class ArchiveCheck {
 public:
  explicit ArchiveCheck(int archive) : _archive(archive), _directory(archive) {}

  std::string run(std::uint64_t entries) {
    if (!_directory.isWhole()) return "it has no directory";
    if (_directory.entries() != entries || _listLarge() != entries) {
      return "its directory does not have " + std::to_string(entries) + " entries";
    }
    _directory.rewind();
    {
      const WorkerThreads threads(archiveThreads(), [this](std::size_t) { _work(); });
    }
    return _wrong;
  }

 private:
  /// Finds the large entries, the largest first. Returned: how many there are of all sizes.
  std::uint64_t _listLarge() {
    std::uint64_t entries = 0;
    for (; auto entry = _directory.next(); ++entries) {
      if (entry->size >= kLarge) _large.push_back(std::move(*entry));
    }
    std::sort(_large.begin(), _large.end(), [](const auto& a, const auto& b) { return a.size > b.size; });
    return entries;
  }

  void _work() try {
    EntryCheck check(_archive);
    while (const auto entry = _next()) _note(check.check(*entry));
  } catch (const std::exception& error) {
    _note(error.what());
  }

  /// The next entry for any thread, nothing when all are taken or something is wrong already.
  std::optional<ZipDirectoryEntry> _next() {
    const std::scoped_lock lock(_mutex);
    if (!_wrong.empty()) return std::nullopt;
    if (_takenLarge < _large.size()) return _large[_takenLarge++];
    auto entry = _directory.next();
    while (entry && entry->size >= kLarge) entry = _directory.next();
    return entry;
  }

  void _note(std::string wrong) {
    const std::scoped_lock lock(_mutex);
    if (_wrong.empty()) _wrong = std::move(wrong);
  }

  const int _archive;
  std::mutex _mutex;
  // Guarded by _mutex while there are several threads.
  ZipDirectory _directory;
  std::vector<ZipDirectoryEntry> _large;
  std::size_t _takenLarge = 0;
  std::string _wrong;  // the first found
};

}  // namespace

std::string checkZipArchive(const std::string& archive, std::uint64_t entries) {
  const Descriptor file(::open(archive.c_str(), O_RDONLY | O_NOFOLLOW | O_CLOEXEC));
  if (!file.isOpen()) return lastSystemError().message();
  try {
    return ArchiveCheck(file.get()).run(entries);
  } catch (const std::exception& error) {
    return error.what();
  }
}

}  // namespace zal
