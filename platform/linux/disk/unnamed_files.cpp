#include "platform/linux/disk/unnamed_files.h"

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <cctype>
#include <climits>
#include <filesystem>
#include <optional>
#include <set>
#include <string_view>
#include <system_error>
#include <utility>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/directory_tree.h"

namespace zal {
namespace {

constexpr std::string_view kUnnamed = " (deleted)";

/// The file's path when it is one of those in the directory.
std::optional<std::string> unnamedPath(int descriptors, const std::string& name, const std::string& prefix) {
  std::array<char, PATH_MAX> text{};
  const ssize_t size = ::readlinkat(descriptors, name.c_str(), text.data(), text.size());
  if (size <= 0) return std::nullopt;
  std::string_view path(text.data(), static_cast<std::size_t>(size));
  if (!path.starts_with(prefix) || !path.ends_with(kUnnamed)) return std::nullopt;
  path.remove_suffix(kUnnamed.size());
  if (path.find('/', prefix.size()) != std::string_view::npos) return std::nullopt;
  return std::string(path);
}

bool isProcess(const std::string& name) {
  return std::isdigit(static_cast<unsigned char>(name.front())) != 0;
}

}  // namespace

std::vector<UnnamedFile> unnamedFilesIn(const std::string& directory) {
  std::vector<UnnamedFile> files;
  std::error_code error;
  const std::string prefix = std::filesystem::canonical(directory, error).string() + "/";
  if (error) return files;
  std::set<std::pair<dev_t, ino_t>> known;
  const Descriptor processes(::open("/proc", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  for (const std::string& process : namesAt(processes.get())) {
    struct stat owner {};
    if (!isProcess(process) || ::fstatat(processes.get(), process.c_str(), &owner, 0) != 0 ||
        owner.st_uid != ::geteuid()) {
      continue;
    }
    const Descriptor descriptors(
        ::openat(processes.get(), (process + "/fd").c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    for (const std::string& name : namesAt(descriptors.get())) {
      auto path = unnamedPath(descriptors.get(), name, prefix);
      UnnamedFile file;
      if (!path || ::fstatat(descriptors.get(), name.c_str(), &file.status, 0) != 0) continue;
      if (file.status.st_nlink != 0 || !known.emplace(file.status.st_dev, file.status.st_ino).second)
        continue;
      file.path = std::move(*path);
      files.push_back(std::move(file));
    }
  }
  return files;
}

}  // namespace zal
