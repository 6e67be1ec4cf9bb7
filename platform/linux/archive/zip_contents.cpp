#include "platform/linux/archive/zip_contents.h"

#include <sys/stat.h>
#include <unzip.h>

#include <memory>

namespace zal {
namespace {

constexpr std::uint64_t kLargestText = 1ULL << 30U;
constexpr std::size_t kLongestEntryName = 65'535;  // what the container can hold

struct CloseZip {
  void operator()(void* archive) const { unzClose(archive); }
};
using OpenZip = std::unique_ptr<void, CloseZip>;

struct Current {
  std::string name;
  unz_file_info64 information{};
};

std::optional<Current> currentEntry(unzFile archive) {
  Current entry;
  if (unzGetCurrentFileInfo64(archive, &entry.information, nullptr, 0, nullptr, 0, nullptr, 0) != UNZ_OK) {
    return std::nullopt;
  }
  if (entry.information.size_filename > kLongestEntryName) return std::nullopt;
  entry.name.resize(entry.information.size_filename + 1);
  if (unzGetCurrentFileInfo64(archive, &entry.information, entry.name.data(), entry.name.size(), nullptr, 0,
                              nullptr, 0) != UNZ_OK) {
    return std::nullopt;
  }
  entry.name.pop_back();
  return entry;
}

bool isRegular(const Current& entry) {
  if (entry.name.ends_with('/')) return false;
  const auto mode = static_cast<mode_t>(entry.information.external_fa >> 16U);
  // Archives of other makers may know no modes.
  return (mode & S_IFMT) == 0 || S_ISREG(mode);
}

/// Calls `visit` for each entry until it says false. Returned: whether the archive could be read.
template <class Visit>
bool forEachEntry(unzFile archive, Visit&& visit) {
  int step = unzGoToFirstFile(archive);
  // An archive with nothing in it has no first file either.
  if (step == UNZ_END_OF_LIST_OF_FILE) return true;
  for (; step == UNZ_OK; step = unzGoToNextFile(archive)) {
    const auto entry = currentEntry(archive);
    if (!entry) return false;
    if (!visit(*entry)) return true;
  }
  return step == UNZ_END_OF_LIST_OF_FILE;
}

std::optional<std::string> readCurrent(unzFile archive, std::uint64_t bytes) {
  if (bytes > kLargestText || unzOpenCurrentFile(archive) != UNZ_OK) return std::nullopt;
  std::string text(static_cast<std::size_t>(bytes), '\0');
  std::size_t filled = 0;
  while (filled < text.size()) {
    const int got =
        unzReadCurrentFile(archive, text.data() + filled, static_cast<unsigned>(text.size() - filled));
    if (got <= 0) break;
    filled += static_cast<std::size_t>(got);
  }
  const bool whole = filled == text.size();
  // Closing says whether the checksum was right.
  if (unzCloseCurrentFile(archive) != UNZ_OK || !whole) return std::nullopt;
  return text;
}

}  // namespace

std::optional<std::vector<ZipEntry>> listZip(const std::string& archive) {
  const OpenZip file(unzOpen64(archive.c_str()));
  if (!file) return std::nullopt;
  std::vector<ZipEntry> entries;
  const bool readable = forEachEntry(file.get(), [&](const Current& entry) {
    if (isRegular(entry)) entries.push_back({entry.name, entry.information.uncompressed_size});
    return true;
  });
  if (!readable) return std::nullopt;
  return entries;
}

std::optional<std::string> readZipEntry(const std::string& archive, const std::string& name) {
  const OpenZip file(unzOpen64(archive.c_str()));
  if (!file) return std::nullopt;
  std::optional<std::string> text;
  forEachEntry(file.get(), [&](const Current& entry) {
    if (entry.name != name) return true;
    if (isRegular(entry)) text = readCurrent(file.get(), entry.information.uncompressed_size);
    return false;
  });
  return text;
}

}  // namespace zal
