#include "platform/linux/disk/archive_parts.h"

#include <algorithm>

#include "platform/linux/archive/entry_check.h"
#include "platform/linux/archive/zip_directory.h"

namespace zal {
namespace {

constexpr std::uint64_t kStart = 256U << 10U;
constexpr unsigned kStored = 0;
constexpr std::string_view kManifest = "Manifest.json";
constexpr std::string_view kFailure = "[Failure Reason: ";

std::string_view belowTop(std::string_view name) {
  const std::size_t slash = name.find('/');
  return slash == std::string_view::npos ? "" : name.substr(slash + 1);
}

bool isManifestName(std::string_view name) { return name == kManifest || name.starts_with("Manifest.json-"); }

}  // namespace

std::optional<std::string> manifestIn(int archive, std::uint64_t longest) {
  ZipDirectory directory(archive);
  std::optional<ZipDirectoryEntry> last;
  if (!directory.isWhole()) return std::nullopt;
  while (auto entry = directory.next()) last = std::move(entry);
  if (!last || !directory.isAtEnd() || !isManifestName(belowTop(last->name)) || last->size > longest) {
    return std::nullopt;
  }
  std::string text;
  const std::string trouble = EntryCheck(archive).troubleOf(
      *last, [&text](const char* bytes, std::size_t size) { text.append(bytes, size); });
  if (!trouble.empty()) return std::nullopt;
  return text;
}

std::string sessionLogStart(int archive) {
  ZipDirectory directory(archive);
  if (!directory.isWhole()) return "";
  while (auto entry = directory.next()) {
    if (!isSessionLogName(belowTop(entry->name))) continue;
    // An entry that says to be shorter than it is: reading it ends there.
    entry->size = std::min(entry->size, kStart);
    if (entry->method == kStored) entry->packedSize = entry->size;
    std::string text;
    static_cast<void>(EntryCheck(archive).troubleOf(
        *entry, [&text](const char* bytes, std::size_t size) { text.append(bytes, size); }));
    return text;
  }
  return "";
}

bool isSessionLogName(std::string_view name) { return name.starts_with("Log (") && name.ends_with(").log"); }

bool hasFailureReason(std::string_view log) {
  for (std::size_t at = log.find(kFailure); at != std::string_view::npos; at = log.find(kFailure, at + 1)) {
    if (at == 0 || log[at - 1] == '\n') return true;
  }
  return false;
}

}  // namespace zal
