#include "platform/linux/archive/zip_directory.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>

#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

// The format's records: their signatures and fixed parts.
constexpr std::uint32_t kEntryMark = 0x02014B50, kHeaderMark = 0x04034B50, kEndMark = 0x06054B50;
constexpr std::uint32_t kWideEndMark = 0x06064B50, kWideLocatorMark = 0x07064B50;
constexpr std::size_t kEntrySize = 46, kHeaderSize = 30, kEndRecordSize = 22;
constexpr std::size_t kWideEndSize = 56, kWideLocatorSize = 20;
constexpr std::uint64_t kWideField = 1;
constexpr std::uint64_t kSeeWide = 0xFFFFFFFF, kSeeWideCount = 0xFFFF;
constexpr std::size_t kBuffer = 64U << 10U;

/// Takes the wide values in the order of the fields that refer to them.
bool takeWideFields(const std::string& extra, std::array<std::uint64_t*, 3> fields) {
  for (std::size_t at = 0; at + 4 <= extra.size();) {
    const std::size_t size = loadLittle(extra.data() + at + 2, 2);
    if (at + 4 + size > extra.size()) return false;
    if (loadLittle(extra.data() + at, 2) != kWideField) {
      at += 4 + size;
      continue;
    }
    std::size_t value = at + 4;
    for (std::uint64_t* field : fields) {
      if (*field != kSeeWide) continue;
      if (value + 8 > at + 4 + size) return false;
      *field = loadLittle(extra.data() + value, 8);
      value += 8;
    }
    return true;
  }
  return std::none_of(fields.begin(), fields.end(), [](const auto* field) { return *field == kSeeWide; });
}

}  // namespace

bool readAt(int file, std::uint64_t position, char* bytes, std::size_t size) {
  while (size > 0) {
    const ssize_t got = ::pread(file, bytes, size, static_cast<off_t>(position));
    if (got < 0 && errno == EINTR) continue;
    if (got <= 0) return false;
    bytes += got;
    position += static_cast<std::uint64_t>(got);
    size -= static_cast<std::size_t>(got);
  }
  return true;
}

ZipDirectory::ZipDirectory(int file) : _file(file), _buffer(std::make_unique<char[]>(kBuffer)) {
  _isWhole = _findDirectory();
  _at = _begin;
}

bool ZipDirectory::_findDirectory() {
  struct stat status {};
  if (::fstat(_file, &status) != 0) return false;
  const auto size = static_cast<std::uint64_t>(status.st_size);
  std::array<char, kEndRecordSize> end{};
  if (size < kEndRecordSize || !readAt(_file, size - kEndRecordSize, end.data(), end.size())) return false;
  const auto comment = loadLittle(end.data() + 20, 2);
  if (loadLittle(end.data(), 4) != kEndMark || comment != 0) return false;
  _entries = loadLittle(end.data() + 10, 2);
  std::uint64_t length = loadLittle(end.data() + 12, 4);
  _begin = loadLittle(end.data() + 16, 4);
  _end = size - kEndRecordSize;
  if (_entries == kSeeWideCount || length == kSeeWide || _begin == kSeeWide) {
    std::array<char, kWideLocatorSize> locator{};
    std::array<char, kWideEndSize> wide{};
    if (_end < locator.size() || !readAt(_file, _end - locator.size(), locator.data(), locator.size()) ||
        loadLittle(locator.data(), 4) != kWideLocatorMark) {
      return false;
    }
    const std::uint64_t records = _end - locator.size();
    _end = loadLittle(locator.data() + 8, 8);
    if (_end > records || records - _end < wide.size()) return false;
    if (!readAt(_file, _end, wide.data(), wide.size()) || loadLittle(wide.data(), 4) != kWideEndMark) {
      return false;
    }
    _entries = loadLittle(wide.data() + 32, 8);
    length = loadLittle(wide.data() + 40, 8);
    _begin = loadLittle(wide.data() + 48, 8);
  }
  return _begin <= _end && _end - _begin == length;
}

bool ZipDirectory::_read(std::uint64_t position, char* bytes, std::size_t size) {
  if (position < _bufferBegin || position + size > _bufferBegin + _bufferSize) {
    _bufferBegin = position;
    _bufferSize = static_cast<std::size_t>(std::min<std::uint64_t>(kBuffer, _end - position));
    if (size > _bufferSize || !readAt(_file, _bufferBegin, _buffer.get(), _bufferSize)) {
      _bufferSize = 0;
      return size > kBuffer && size <= _end - position && readAt(_file, position, bytes, size);
    }
  }
  std::memcpy(bytes, _buffer.get() + (position - _bufferBegin), size);
  return true;
}

std::optional<ZipDirectoryEntry> ZipDirectory::next() {
  std::array<char, kEntrySize> fixed{};
  if (_at >= _end || !_read(_at, fixed.data(), fixed.size())) return std::nullopt;
  if (loadLittle(fixed.data(), 4) != kEntryMark) return std::nullopt;
  ZipDirectoryEntry entry;
  entry.method = static_cast<unsigned>(loadLittle(fixed.data() + 10, 2));
  entry.crc = static_cast<std::uint32_t>(loadLittle(fixed.data() + 16, 4));
  entry.packedSize = loadLittle(fixed.data() + 20, 4);
  entry.size = loadLittle(fixed.data() + 24, 4);
  entry.header = loadLittle(fixed.data() + 42, 4);
  entry.mode = static_cast<unsigned>(loadLittle(fixed.data() + 40, 2));
  entry.name.resize(loadLittle(fixed.data() + 28, 2));
  std::string extra(loadLittle(fixed.data() + 30, 2), '\0');
  const std::size_t comment = loadLittle(fixed.data() + 32, 2);
  if (comment != 0 || !_read(_at + kEntrySize, entry.name.data(), entry.name.size()) ||
      !_read(_at + kEntrySize + entry.name.size(), extra.data(), extra.size()) ||
      !takeWideFields(extra, {&entry.size, &entry.packedSize, &entry.header})) {
    return std::nullopt;
  }
  _at += kEntrySize + entry.name.size() + extra.size();
  return entry;
}

std::optional<std::uint64_t> ZipDirectory::contentOf(int file, const ZipDirectoryEntry& entry) {
  std::array<char, kHeaderSize> fixed{};
  std::string name(entry.name.size(), '\0');
  if (!readAt(file, entry.header, fixed.data(), fixed.size()) ||
      !readAt(file, entry.header + kHeaderSize, name.data(), name.size())) {
    return std::nullopt;
  }
  if (loadLittle(fixed.data(), 4) != kHeaderMark || loadLittle(fixed.data() + 8, 2) != entry.method ||
      loadLittle(fixed.data() + 14, 4) != entry.crc || loadLittle(fixed.data() + 26, 2) != name.size() ||
      name != entry.name) {
    return std::nullopt;
  }
  return entry.header + kHeaderSize + name.size() + loadLittle(fixed.data() + 28, 2);
}

}  // namespace zal
