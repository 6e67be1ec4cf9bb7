#include <algorithm>
#include <filesystem>

#include "collectors/directory_listing.h"
#include "collectors/file_collector.h"
#include "collectors/file_url.h"
#include "collectors/gathering_witness.h"
#include "platform/agent_log.h"
#include "platform/file_placement.h"

namespace zal {
namespace {

std::string inside(const std::string& directory, const std::string& name) { return directory + "/" + name; }

bool isCopied(const std::string& name) {
  return name.find("beacond") != std::string::npos || name.find(".log.gz") == std::string::npos;
}

std::string lowercase(std::string text) {
  for (char& c : text) {
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
  }
  return text;
}

bool containsAny(const std::string& name, const std::vector<std::string>& fragments) {
  const std::string folded = lowercase(name);
  return std::any_of(fragments.begin(), fragments.end(), [&](const std::string& fragment) {
    return folded.find(lowercase(fragment)) != std::string::npos;
  });
}

}  // namespace

// The slot belongs to the whole run and a copy that succeeds leaves it alone: readers of these logs
// know that nothing after the first failure line can be relied on.
void FileCollector::_copy(const std::string& source, const std::string& target, std::error_code& errorSlot) {
  const std::error_code error = _files.copy(source, target);
  _tell(source, std::filesystem::path(target).parent_path().string(), error);
  if (error) errorSlot = error;
  if (!errorSlot) return;
  _log.warning("Failed to copy from " + fileUrl(source) + " to " + fileUrl(target) +
               " with error: " + errorSlot.message());
}

void FileCollector::CopyDirectoryContents(const std::string& sourceDirectory, const std::string& directory) {
  const std::string source = _resolved(sourceDirectory);
  const auto names = listDirectory(source, HiddenEntries::skipped);
  if (!names) return _tell(source, directory, SourceOutcome::absent);
  std::error_code errorSlot;
  for (const auto& name : *names) {
    if (isCopied(name)) _copy(inside(source, name), inside(directory, name), errorSlot);
  }
}

void FileCollector::CopyCrashReportsMatching(const std::vector<std::string>& fragments,
                                             const std::string& directory) {
  const std::string source = _resolved(_roots.DiagnosticReportRoot);
  _log.notice("Copying diagnostic logs from: " + fileUrl(source + "/"));
  const auto names = listDirectory(source, HiddenEntries::skipped);
  if (!names) return;
  std::error_code errorSlot;
  for (const auto& name : *names) {
    std::error_code notThere;
    if (std::filesystem::is_directory(inside(source, name), notThere)) continue;
    if (containsAny(name, fragments)) _copy(inside(source, name), inside(directory, name), errorSlot);
  }
}

}  // namespace zal
