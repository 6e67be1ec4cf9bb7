#include "platform/linux/files/whole_file.h"

#include <fcntl.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <charconv>
#include <cstdio>

#include "platform/linux/files/rename_no_replace.h"
#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

constexpr std::string_view kUnfinished = ".new-";

std::string temporaryPathBeside(const std::string& path) {
  static std::atomic<unsigned> counter{0};
  std::string temporary = path.substr(0, path.rfind('/') + 1);
  temporary.append(kUnfinished).append(std::to_string(::getpid())).append("-");
  return temporary + std::to_string(++counter);
}

std::error_code moveInto(const std::string& temporary, const std::string& path, ExistingFile existing) {
  if (existing == ExistingFile::stays) return renameNoReplace(temporary, path);
  return ::rename(temporary.c_str(), path.c_str()) == 0 ? std::error_code{} : lastSystemError();
}

}  // namespace

std::optional<pid_t> makerOfUnfinished(std::string_view name) {
  if (!name.starts_with(kUnfinished)) return std::nullopt;
  name.remove_prefix(kUnfinished.size());
  pid_t process = 0;
  const auto [end, error] = std::from_chars(name.data(), name.data() + name.size(), process);
  if (error != std::errc() || end == name.data() + name.size() || *end != '-' || process <= 0)
    return std::nullopt;
  return process;
}

std::error_code writeWhole(int descriptor, std::string_view content) {
  while (!content.empty()) {
    const ssize_t count = ::write(descriptor, content.data(), content.size());
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return lastSystemError();
    content.remove_prefix(static_cast<std::size_t>(count));
  }
  return {};
}

std::error_code placeWholeFile(const std::string& path, std::string_view content, ExistingFile existing) {
  const std::string temporary = temporaryPathBeside(path);
  const int descriptor =
      ::open(temporary.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_NOFOLLOW | O_CLOEXEC, 0600);
  if (descriptor < 0) return lastSystemError();
  std::error_code error = writeWhole(descriptor, content);
  ::close(descriptor);
  if (!error) error = moveInto(temporary, path, existing);
  if (error) ::unlink(temporary.c_str());
  return error;
}

}  // namespace zal
