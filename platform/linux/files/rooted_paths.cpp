#include "platform/linux/files/rooted_paths.h"

#include <fcntl.h>

#include <algorithm>
#include <optional>

#include "platform/linux/files/beneath.h"
#include "platform/linux/files/system_error.h"
#include "platform/open_directories.h"
#include "platform/standard_path.h"

namespace zal {
namespace {

std::string withoutSlashesAtItsEnd(std::string path) {
  while (path.size() > 1 && path.back() == '/') path.pop_back();
  return path;
}

/// What follows the root in the path; nothing when the path is elsewhere.
std::optional<std::string> belowRoot(const std::string& path, const std::string& root) {
  if (path == root) return std::string();
  const std::string start = root == "/" ? root : root + "/";
  if (!path.starts_with(start)) return std::nullopt;
  const std::size_t rest = path.find_first_not_of('/', start.size());
  return rest == std::string::npos ? std::string() : path.substr(rest);
}

Descriptor openThroughLinks(const std::string& directory) {
  return Descriptor(::open(directory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
}

}  // namespace

RootedPaths::RootedPaths(const std::vector<std::string>& roots, std::string_view home) {
  for (const std::string& root : roots) {
    const bool isBelowHome = root == "~" || root.starts_with("~/");
    std::string path = isBelowHome ? std::string(home).append(root.substr(1)) : root;
    if (path.starts_with('/')) _roots.push_back(withoutSlashesAtItsEnd(std::move(path)));
  }
  std::stable_sort(_roots.begin(), _roots.end(),
                   [](const auto& left, const auto& right) { return left.size() > right.size(); });
}

RootedPaths::Split RootedPaths::_split(const std::string& path) const {
  for (const std::string& root : _roots) {
    if (auto rest = belowRoot(path, root)) return {root, std::move(*rest)};
  }
  // A path whose root was resolved already.
  Split found{{}, path};
  for (const std::string& root : _roots) {
    std::string resolved = resolveAndStandardize(root, {});
    if (resolved.size() <= found.root.size()) continue;
    if (auto rest = belowRoot(path, resolved)) found = {std::move(resolved), std::move(*rest)};
  }
  return found;
}

RootedPlace RootedPaths::placeOf(const std::string& given) const {
  const std::string path = withoutSlashesAtItsEnd(given);
  const auto refused = [](std::errc error) { return RootedPlace{{}, {}, std::make_error_code(error)}; };
  const std::size_t slash = path.rfind('/');
  RootedPlace place;
  place.name = path.substr(slash + 1);
  if (place.name.empty()) return refused(std::errc::no_such_file_or_directory);
  if (place.name == "." || place.name == "..") return refused(std::errc::cross_device_link);
  const std::string parent =
      slash == std::string::npos ? "." : path.substr(0, std::max<std::size_t>(slash, 1));
  const Split split = _split(parent);
  if (path.find('\0') != std::string::npos) return refused(std::errc::invalid_argument);
  place.directory = openThroughLinks(split.root.empty() ? parent : split.root);
  if (place.directory.isOpen() && !split.rest.empty() && !split.root.empty())
    place.directory = openDirectoryBeneath(place.directory.get(), split.rest);
  if (!place.directory.isOpen()) place.error = lastSystemError();
  return place;
}

std::error_code RootedPaths::makeDirectories(const std::string& path) const {
  const Split split = _split(withoutSlashesAtItsEnd(path));
  if (split.root.empty()) return createDirectoriesWithMode0777(path);
  Descriptor root = openThroughLinks(split.root);
  if (!root.isOpen() && errno == ENOENT) {
    if (const std::error_code error = createDirectoriesWithMode0777(split.root)) return error;
    root = openThroughLinks(split.root);
  }
  return root.isOpen() ? makeDirectoriesBeneath(root.get(), split.rest) : lastSystemError();
}

std::vector<std::string> writtenRoots(const DirectoryRoots& roots) {
  return {roots.UserLogRoot,     roots.MobileLogRoot,      roots.DiagnosticReportRoot,
          roots.WirelessLogRoot, roots.WirelessReportRoot, roots.RootReportRoot,
          roots.SystemLogRoot,   roots.SystemReportRoot,   roots.TemporaryRoot,
          roots.RuntimeRoot,     roots.StateRoot};
}

}  // namespace zal
