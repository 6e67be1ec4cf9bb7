#include "platform/linux/archive/entry_check.h"

#include <isa-l.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

constexpr std::size_t kInput = 128U << 10U;
constexpr std::size_t kOutput = 256U << 10U;
constexpr unsigned kStored = 0, kDeflated = 8;

}  // namespace

EntryCheck::EntryCheck(int archive)
    : _archive(archive),
      _state(std::make_unique<inflate_state>()),
      _input(new unsigned char[kInput]),
      _output(new unsigned char[kOutput]) {}

EntryCheck::~EntryCheck() = default;

std::string EntryCheck::check(const ZipDirectoryEntry& entry) {
  const std::string trouble = troubleOf(entry, {});
  return trouble.empty() ? "" : '"' + entry.name + "\" " + trouble;
}

std::string EntryCheck::troubleOf(const ZipDirectoryEntry& entry, const Content& content) {
  const auto begin = ZipDirectory::contentOf(_archive, entry);
  if (!begin) return "has a header that does not fit";
  _error.clear();
  _crc = 0;
  const bool unpacked = entry.method == kDeflated
                            ? _inflate(*begin, entry.packedSize, entry.size, content)
                            : entry.method == kStored && entry.packedSize == entry.size &&
                                  _readStored(*begin, entry.size, content);
  if (_error) return "cannot be read: " + _error.message();
  if (!unpacked) return "cannot be unpacked";
  return _crc == entry.crc ? "" : "has a wrong checksum";
}

void EntryCheck::_take(const unsigned char* bytes, std::size_t size, const Content& content) {
  _crc = ::crc32_gzip_refl(_crc, bytes, size);
  if (content) content(reinterpret_cast<const char*>(bytes), size);
}

// The next bytes of the entry; none when the file ends or fails.
std::size_t EntryCheck::_read(std::uint64_t position, std::uint64_t limit) {
  const auto size = static_cast<std::size_t>(std::min<std::uint64_t>(limit, kInput));
  for (;;) {
    const ssize_t got = ::pread(_archive, _input.get(), size, static_cast<off_t>(position));
    if (got < 0 && errno == EINTR) continue;
    if (got < 0) _error = lastSystemError();
    return got > 0 ? static_cast<std::size_t>(got) : 0;
  }
}

bool EntryCheck::_readStored(std::uint64_t position, std::uint64_t size, const Content& content) {
  while (size > 0) {
    const std::size_t got = _read(position, size);
    if (got == 0) return false;
    _take(_input.get(), got, content);
    position += got;
    size -= got;
  }
  return true;
}

bool EntryCheck::_inflate(std::uint64_t position, std::uint64_t packed, std::uint64_t size,
                          const Content& content) {
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
    unpacked += got;
    if (unpacked > size) return false;
    _take(_output.get(), got, content);
    // Bytes are still to come, but there are none.
    if (got == 0 && before == _state->avail_in && packed == 0 && _state->block_state != ISAL_BLOCK_FINISH) {
      return false;
    }
  }
  return packed == 0 && _state->avail_in == 0 && unpacked == size;
}

}  // namespace zal
