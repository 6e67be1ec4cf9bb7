#include "collectors/file_collector.h"

#include <filesystem>

#include "collectors/directory_listing.h"
#include "collectors/gathering_witness.h"
#include "platform/agent_log.h"
#include "platform/file_placement.h"
#include "platform/standard_path.h"

namespace zal {
namespace {

bool fileExists(const std::string& path) {
  std::error_code error;
  const bool exists = std::filesystem::exists(path, error);
  // Once more where the look failed: what is there now may be gone when somebody else comes for it.
  return error ? std::filesystem::exists(path, error) : exists;
}

std::string nameOf(const std::string& path) { return std::filesystem::path(path).filename().string(); }

/// The path relative to the directory that its text leads below, "." and ".." taken out; else empty.
std::string belowDirectory(const std::string& path, const std::string& directory) {
  const std::filesystem::path relative =
      std::filesystem::path(path).lexically_normal().lexically_relative(directory);
  const bool isBelow = !relative.empty() && relative != "." && *relative.begin() != "..";
  return isBelow ? relative.string() : std::string();
}

}  // namespace

std::string FileCollector::_resolved(const std::string& path) const {
  return resolveAndStandardize(path, _files.homeDirectory());
}

void FileCollector::_tell(const std::string& source, const std::string& directory,
                          SourceOutcome outcome) const {
  if (_witnesses != nullptr) _witnesses->source(source, directory, outcome);
}

void FileCollector::_tell(const std::string& source, const std::string& directory,
                          const std::error_code& error) const {
  if (_witnesses == nullptr) return;
  const bool isThere = !error || error == std::errc::file_exists;
  _witnesses->source(source, directory, isThere ? SourceOutcome::taken : SourceOutcome::failed,
                     isThere ? "" : error.message());
}

std::error_code FileCollector::makeDirectory(const std::string& directory) {
  return _files.makeDirectories(directory);
}

void FileCollector::_makeParent(const std::string& target) {
  makeDirectory(std::filesystem::path(target).parent_path().string());
}

std::string FileCollector::_source(const std::string& path, const std::string& directory) const {
  std::string resolved = _resolved(path);
  if (!fileExists(resolved)) {
    _tell(resolved, directory, SourceOutcome::absent);
    return {};
  }
  const std::string below = belowDirectory(path, _roots.TemporaryRoot);
  if (below.empty() || resolved == _resolved(_roots.TemporaryRoot) + "/" + below) return resolved;
  _tell(path, directory, std::make_error_code(std::errc::too_many_symbolic_link_levels));
  _log.warning(path + " is not taken: a symbolic link that anybody may have laid leads to " + resolved);
  return {};
}

bool FileCollector::LinkFileIntoDirectory(const std::string& source, const std::string& directory,
                                          const std::string& suffix) {
  const std::string resolved = _source(source, directory);
  if (resolved.empty()) return false;
  const std::string target = directory + "/" + nameOf(resolved) + suffix;
  _makeParent(target);
  const std::error_code error = _files.link(resolved, target);
  _tell(resolved, directory, error);
  return !error;
}

bool FileCollector::_linkEntry(const std::string& sourceDirectory, const std::string& name,
                               const std::string& directory) {
  return LinkFileIntoDirectory(sourceDirectory + "/" + name, directory, "");
}

bool FileCollector::LinkDirectoryEntriesWithPrefix(const std::string& sourceDirectory,
                                                   const std::string& prefix, const std::string& directory) {
  bool result = true;
  const auto names = listDirectory(_resolved(sourceDirectory), HiddenEntries::listed);
  bool anyMatched = false;
  for (const auto& name : names.value_or(std::vector<std::string>())) {
    if (!name.starts_with(prefix)) continue;
    anyMatched = true;
    result = _linkEntry(sourceDirectory, name, directory) && result;
  }
  if (!anyMatched) _tell(sourceDirectory + "/" + prefix + "*", directory, SourceOutcome::absent);
  return result;
}

bool FileCollector::LinkDirectoryEntriesWithSuffix(const std::string& sourceDirectory,
                                                   const std::string& suffix, const std::string& directory) {
  bool result = true;
  const auto names = listDirectory(sourceDirectory, HiddenEntries::listed);
  if (!names) return result;
  for (const auto& name : *names) {
    if (name.ends_with(suffix)) result = _linkEntry(sourceDirectory, name, directory) && result;
  }
  return result;
}

bool FileCollector::MoveFileIntoDirectory(const std::string& source, const std::string& directory,
                                          const std::string& suffix) {
  return _move(source, directory, suffix, Reach::anywhere).value_or(false);
}

std::optional<bool> FileCollector::MoveFileWithinFileSystem(const std::string& source,
                                                            const std::string& directory,
                                                            const std::string& suffix) {
  return _move(source, directory, suffix, Reach::fileSystem);
}

std::optional<bool> FileCollector::_move(const std::string& source, const std::string& directory,
                                         const std::string& suffix, Reach reach) {
  const std::string resolved = _source(source, directory);
  const std::string name = nameOf(resolved);
  if (name.empty()) return false;  // "/" has no name to go under
  const std::string wanted = directory + "/" + name + suffix;
  const auto target = _files.uniqueSavePath(wanted);
  _makeParent(target.value_or(wanted));
  if (target) {
    const std::error_code error =
        reach == Reach::anywhere ? _files.move(resolved, *target) : _files.rename(resolved, *target);
    if (reach == Reach::fileSystem && error == std::errc::cross_device_link) return std::nullopt;
    _tell(resolved, directory, error);
    return !error;
  }
  // Without a free name it goes all the same: what was asked for is that it no longer lies there.
  std::error_code ignored;
  std::filesystem::remove(resolved, ignored);
  return true;
}

}  // namespace zal
