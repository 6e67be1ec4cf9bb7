#include "platform/linux/archive/zip_container.h"

#include <zip.h>
#include <zlib.h>

#include <array>
#include <cerrno>
#include <ctime>
#include <limits>
#include <utility>

#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

constexpr unsigned long kMadeByUnixVersion30 = (3U << 8U) | 30U;
constexpr unsigned long kNameIsUtf8 = 1U << 11U;
constexpr unsigned long kDirectoryAttribute = 0x10;
constexpr std::size_t kLongestName = 65535;
// Below 4 GiB by what a stream of stored blocks and the headers may add.
constexpr std::uint64_t kZip64From = 0xFF000000U;
constexpr std::uint64_t kWideFrom = 0xFFFFFFFFU, kWideEntries = 0xFFFF;
constexpr std::size_t kEndSize = 22;
constexpr int kFirstYear = 1980, kLastYear = 2107;

ArchiveOutput& outputOf(void* stream) { return *static_cast<ArchiveOutput*>(stream); }

void* openOutput(void* opaque, const void* /*name*/, int /*mode*/) { return opaque; }

uLong writeOutput(void* /*opaque*/, void* stream, const void* bytes, uLong size) {
  outputOf(stream).write(static_cast<const char*>(bytes), size);
  return outputOf(stream).error() ? 0 : size;
}

uLong readNothing(void* /*opaque*/, void* /*stream*/, void* /*bytes*/, uLong /*size*/) { return 0; }

ZPOS64_T tellOutput(void* /*opaque*/, void* stream) { return outputOf(stream).position(); }

long seekOutput(void* /*opaque*/, void* stream, ZPOS64_T offset, int origin) {
  ArchiveOutput& output = outputOf(stream);
  const std::uint64_t from = origin == ZLIB_FILEFUNC_SEEK_SET   ? 0
                             : origin == ZLIB_FILEFUNC_SEEK_CUR ? output.position()
                                                                : output.size();
  output.seek(from + offset);
  return 0;
}

int closeOutput(void* /*opaque*/, void* /*stream*/) { return 0; }

int outputError(void* /*opaque*/, void* stream) { return outputOf(stream).error() ? 1 : 0; }

/// The format's own time: local, in steps of two seconds, of 128 years.
tm_zip formatTime(std::time_t time) {
  tm local{};
  if (::localtime_r(&time, &local) == nullptr || local.tm_year + 1900 < kFirstYear) {
    return {0, 0, 0, 1, 0, kFirstYear};
  }
  if (local.tm_year + 1900 > kLastYear) return {58, 59, 23, 31, 11, kLastYear};
  const auto part = [](int value) { return static_cast<uInt>(value); };
  return {part(local.tm_sec),  part(local.tm_min), part(local.tm_hour),
          part(local.tm_mday), part(local.tm_mon), part(local.tm_year + 1900)};
}

/// The extended timestamp field: seconds since 1970, when they fit into 32 bits.
struct TimeField {
  explicit TimeField(std::time_t time) {
    if (time < std::numeric_limits<std::int32_t>::min() || time > std::numeric_limits<std::int32_t>::max()) {
      return;
    }
    const auto seconds = static_cast<std::uint32_t>(time);
    for (unsigned i = 0; i < 4; ++i) bytes[5 + i] = static_cast<char>(seconds >> 8 * i);
    size = static_cast<uInt>(bytes.size());
  }
  std::array<char, 9> bytes{'U', 'T', 5, 0, 1 /* of modification alone */};
  uInt size = 0;
};

}  // namespace

ZipContainer::ZipContainer(ArchiveOutput& output) : _output(output) {
  zlib_filefunc64_def functions{&openOutput, &readNothing, &writeOutput, &tellOutput,
                                &seekOutput, &closeOutput, &outputError, &output};
  _archive = ::zipOpen2_64("", APPEND_STATUS_CREATE, nullptr, &functions);
  if (_archive == nullptr) throw std::system_error(ENOMEM, std::generic_category());
}

ZipContainer::~ZipContainer() {
  if (_archive != nullptr) ::zipClose(_archive, nullptr);
}

void ZipContainer::_check(int result) const {
  if (_output.error()) throw std::system_error(_output.error());
  if (result != ZIP_OK) throw std::system_error(EIO, std::generic_category(), "the zip library");
}

void ZipContainer::beginEntry(const ArchiveEntry& entry, ZipMethod method, std::uint64_t expectedSize) {
  if (entry.name.size() > kLongestName) throw std::system_error(ENAMETOOLONG, std::generic_category());
  zip_fileinfo information{};
  information.tmz_date = formatTime(entry.status.st_mtime);
  information.external_fa = static_cast<uLong>(entry.status.st_mode) << 16U;
  if (S_ISDIR(entry.status.st_mode)) information.external_fa |= kDirectoryAttribute;
  const TimeField time(entry.status.st_mtime);
  _check(::zipOpenNewFileInZip4_64(_archive, entry.name.c_str(), &information, time.bytes.data(), time.size,
                                   time.bytes.data(), time.size, nullptr,
                                   method == ZipMethod::deflated ? Z_DEFLATED : 0, Z_DEFAULT_COMPRESSION,
                                   1 /* raw */, -MAX_WBITS, DEF_MEM_LEVEL, Z_DEFAULT_STRATEGY, nullptr, 0,
                                   kMadeByUnixVersion30, kNameIsUtf8, expectedSize >= kZip64From ? 1 : 0));
  ++_entries;
}

void ZipContainer::write(const char* bytes, std::size_t size) {
  _check(::zipWriteInFileInZip(_archive, bytes, static_cast<unsigned>(size)));
}

void ZipContainer::endEntry(std::uint64_t size, std::uint32_t crc) {
  _check(::zipCloseFileInZipRaw64(_archive, size, crc));
}

void ZipContainer::finish() {
  const std::uint64_t directory = _output.size();
  _check(::zipClose(std::exchange(_archive, nullptr), nullptr));
  if (_entries >= kWideEntries && directory < kWideFrom) _addWideEnd(directory);
}

/// The library counts to 65535 only, unless the archive is larger than 4 GiB: puts the records that
/// count further before its last one.
void ZipContainer::_addWideEnd(std::uint64_t directory) {
  const std::uint64_t wideEnd = _output.size() - kEndSize;
  std::array<char, 56> end{'P', 'K', 6, 6, 44 /* bytes that follow */};
  end[12] = end[14] = 45;  // the version that knows this
  storeLittle(&end[24], _entries, 8);
  storeLittle(&end[32], _entries, 8);
  storeLittle(&end[40], wideEnd - directory, 8);
  storeLittle(&end[48], directory, 8);
  std::array<char, 20> locator{'P', 'K', 6, 7};
  storeLittle(&locator[8], wideEnd, 8);
  locator[16] = 1;  // disk
  std::array<char, kEndSize> last{'P', 'K', 5, 6};
  storeLittle(&last[8], kWideEntries, 2);
  storeLittle(&last[10], kWideEntries, 2);
  storeLittle(&last[12], wideEnd - directory, 4);
  storeLittle(&last[16], directory, 4);
  _output.seek(wideEnd);
  _output.write(end.data(), end.size());
  _output.write(locator.data(), locator.size());
  _output.write(last.data(), last.size());
  _check(ZIP_OK);
}

}  // namespace zal
