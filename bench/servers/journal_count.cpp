#include "bench/servers/journal_count.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <utility>

namespace zal::bench {
namespace {

constexpr std::size_t kMappedLength = 4096;
constexpr std::size_t kStatePosition = 16;
constexpr std::size_t kEntriesPosition = 152;
constexpr unsigned char kArchived = 2;

}  // namespace

JournalCount::~JournalCount() { _close(); }

void JournalCount::watch(std::filesystem::path activeFile) {
  _close();
  _path = std::move(activeFile);
  _inode = 0;
  _inEarlierFiles = 0;
}

void JournalCount::_open() {
  const int file = open(_path.c_str(), O_RDONLY | O_CLOEXEC);
  if (file < 0) return;
  struct stat status {};
  if (fstat(file, &status) == 0 && status.st_ino != _inode &&
      static_cast<std::size_t>(status.st_size) >= kMappedLength) {
    void* mapped = mmap(nullptr, kMappedLength, PROT_READ, MAP_SHARED, file, 0);
    if (mapped != MAP_FAILED) {
      _header = static_cast<const unsigned char*>(mapped);
      _inode = status.st_ino;
    }
  }
  close(file);
}

void JournalCount::_close() {
  if (_header != nullptr) munmap(const_cast<unsigned char*>(_header), kMappedLength);
  _header = nullptr;
}

std::uint64_t JournalCount::entries() {
  if (_header == nullptr) _open();
  if (_header == nullptr) return _inEarlierFiles;
  const bool archived = _header[kStatePosition] == kArchived;
  const std::uint64_t here = *reinterpret_cast<const volatile std::uint64_t*>(_header + kEntriesPosition);
  if (archived) {
    _inEarlierFiles += here;
    _close();
    return _inEarlierFiles;
  }
  return _inEarlierFiles + here;
}

}  // namespace zal::bench
