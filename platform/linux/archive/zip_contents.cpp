#include "platform/linux/archive/zip_contents.h"

#include <fcntl.h>
#include <sys/stat.h>

#include "platform/linux/archive/entry_check.h"
#include "platform/linux/archive/zip_directory.h"
#include "platform/linux/files/descriptor.h"

namespace zal {
namespace {

constexpr std::uint64_t kLargestText = 1ULL << 30U;

Descriptor openArchive(const std::string& path) {
  return Descriptor(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
}

bool isRegular(const ZipDirectoryEntry& entry) {
  if (entry.name.ends_with('/')) return false;
  // Archives of other makers may know no modes.
  return (entry.mode & S_IFMT) == 0 || S_ISREG(entry.mode);
}

std::optional<std::string> contentOf(int file, const ZipDirectoryEntry& entry) {
  if (!isRegular(entry) || entry.size > kLargestText) return std::nullopt;
  std::string text;
  text.reserve(static_cast<std::size_t>(entry.size));
  const std::string trouble = EntryCheck(file).troubleOf(
      entry, [&text](const char* bytes, std::size_t size) { text.append(bytes, size); });
  if (!trouble.empty()) return std::nullopt;
  return text;
}

}  // namespace

std::optional<std::vector<ZipEntry>> listZip(const std::string& archive) {
  const Descriptor file = openArchive(archive);
  ZipDirectory directory(file.get());
  if (!directory.isWhole()) return std::nullopt;
  std::vector<ZipEntry> entries;
  while (const auto entry = directory.next()) {
    if (isRegular(*entry)) entries.push_back({entry->name, entry->size});
  }
  if (!directory.isAtEnd()) return std::nullopt;
  return entries;
}

std::optional<std::string> readZipEntry(const std::string& archive, const std::string& name) {
  const Descriptor file = openArchive(archive);
  ZipDirectory directory(file.get());
  if (!directory.isWhole()) return std::nullopt;
  while (const auto entry = directory.next()) {
    if (entry->name == name) return contentOf(file.get(), *entry);
  }
  return std::nullopt;
}

}  // namespace zal
