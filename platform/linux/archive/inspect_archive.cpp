#include "platform/linux/archive/inspect_archive.h"

#include <algorithm>
#include <array>
#include <utility>

#include "platform/linux/archive/entry_check.h"
#include "platform/linux/archive/sha256.h"
#include "platform/linux/archive/zip_directory.h"
#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

constexpr std::uint64_t kLongestText = std::uint64_t{64} << 20U;
constexpr std::uint32_t kFirstHeader = 0x04034B50, kEmptyArchive = 0x06054B50;

/// What an entry takes of the file.
struct Extent {
  std::uint64_t begin = 0, end = 0;
  std::size_t entry = 0;
};

bool beginsLikeAnArchive(int file) {
  std::array<char, 4> mark{};
  if (!readAt(file, 0, mark.data(), mark.size())) return false;
  const auto number = loadLittle(mark.data(), mark.size());
  return number == kFirstHeader || number == kEmptyArchive;
}

class Inspection {
 public:
  explicit Inspection(int file) : _file(file), _directory(file), _check(file) {}

  ArchiveInspection run() {
    ArchiveInspection result;
    result.isArchive = beginsLikeAnArchive(_file) || _directory.isWhole();
    if (!result.isArchive) return result;
    if (!_directory.isWhole()) {
      result.trouble = "it has no directory at its end";
      return result;
    }
    _list(result);
    _findShared(result);
    for (std::size_t i = 0; i < _entries.size(); ++i) {
      if (result.entries[i].trouble.empty()) _read(i, result);
    }
    return result;
  }

 private:
  void _list(ArchiveInspection& result) {
    while (auto entry = _directory.next()) {
      result.entries.push_back({entry->name, entry->size, "", ""});
      _entries.push_back(std::move(*entry));
    }
    if (_entries.size() != _directory.entries() || !_directory.isAtEnd()) {
      result.trouble = "its directory breaks off after " + std::to_string(_entries.size()) + " of " +
                       std::to_string(_directory.entries()) + " entries";
    }
  }

  /// A small file whose entries are all the same bytes again and again could unpack to any size.
  void _findShared(ArchiveInspection& result) const {
    std::vector<Extent> extents;
    for (std::size_t i = 0; i < _entries.size(); ++i) {
      const auto content = ZipDirectory::contentOf(_file, _entries[i]);
      if (!content) continue;  // the check says so
      const std::uint64_t end = *content + _entries[i].packedSize;
      extents.push_back({_entries[i].header, std::max(end, *content), i});
    }
    std::sort(extents.begin(), extents.end(),
              [](const Extent& a, const Extent& b) { return a.begin < b.begin; });
    std::uint64_t taken = 0;
    for (const Extent& extent : extents) {
      if (extent.begin < taken) result.entries[extent.entry].trouble = "shares bytes with another entry";
      taken = std::max(taken, extent.end);
    }
  }

  void _read(std::size_t index, ArchiveInspection& result) {
    InspectedEntry& inspected = result.entries[index];
    const bool isLast = index + 1 == _entries.size();
    std::optional<std::string> text;
    if (isLast && _entries[index].size <= kLongestText) text.emplace();
    inspected.trouble = _check.troubleOf(_entries[index], [&](const char* bytes, std::size_t size) {
      _hash.add(bytes, size);
      if (text) text->append(bytes, size);
    });
    std::string digest = _hash.takeDigest();
    if (!inspected.trouble.empty()) return;
    if (!inspected.name.ends_with('/')) inspected.sha256 = std::move(digest);
    if (isLast) result.lastText = std::move(text);
  }

  const int _file;
  ZipDirectory _directory;
  EntryCheck _check;
  Sha256 _hash;
  std::vector<ZipDirectoryEntry> _entries;
};

}  // namespace

ArchiveInspection inspectArchive(int file) { return Inspection(file).run(); }

}  // namespace zal
