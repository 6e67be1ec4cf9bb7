#include "platform/linux/files/temporary_leftovers.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <vector>

#include "platform/agent_log.h"
#include "platform/linux/files/descriptor.h"
#include "platform/work_queue.h"

namespace zal {
namespace {

constexpr std::chrono::seconds kDelay{1};

// Longer than any dump takes, so that what another run of this user still works on stays.
constexpr std::chrono::hours kKept{24};

bool isOwnDirectory(const std::string& path) {
  struct stat status {};
  return ::lstat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode) && status.st_uid == ::geteuid();
}

/// Whether it is a file that was to become an archive. One that is to be kept is not to be written.
bool isUnfinished(const std::string& path, const struct stat& status) {
  if (!S_ISREG(status.st_mode) || (status.st_mode & S_IWUSR) == 0) return false;
  const Descriptor file(::open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
  // Who writes an archive holds a lock on it.
  return file.isOpen() && ::flock(file.get(), LOCK_EX | LOCK_NB) == 0;
}

bool isLeftover(const std::string& path, WallTime now, WallTime startedAt) {
  struct stat status {};
  if (::lstat(path.c_str(), &status) != 0) return false;
  const WallTime changed{std::chrono::seconds{status.st_mtim.tv_sec} +
                         std::chrono::microseconds{status.st_mtim.tv_nsec / 1000}};
  return now - changed > kKept || (changed < startedAt && isUnfinished(path, status));
}

std::vector<std::string> entriesOf(const std::string& directory) {
  std::vector<std::string> paths;
  std::error_code error;
  std::filesystem::directory_iterator entry(directory, error);
  for (; !error && entry != std::filesystem::directory_iterator(); entry.increment(error)) {
    paths.push_back(entry->path().string());
  }
  return paths;
}

}  // namespace

std::size_t removeTemporaryLeftovers(const std::string& area, WallTime now, WallTime startedAt) {
  if (!isOwnDirectory(area)) return 0;
  std::size_t removed = 0;
  for (const std::string& path : entriesOf(area)) {
    if (!isLeftover(path, now, startedAt)) continue;
    std::error_code error;
    if (std::filesystem::remove_all(path, error) > 0 && !error) ++removed;
  }
  return removed;
}

void removeTemporaryLeftoversLater(WorkQueue& queue, const Clock& clock, AgentLog& log,
                                   const std::string& area) {
  if (!isOwnDirectory(area)) return;  // the usual case; saves the job and its thread
  queue.asyncAfter(kDelay, [&clock, &log, area, startedAt = clock.wallNow()] {
    const std::size_t removed = removeTemporaryLeftovers(area, clock.wallNow(), startedAt);
    if (removed == 0) return;
    log.notice("Leftovers of earlier runs removed from " + area + ": " + std::to_string(removed));
  });
}

}  // namespace zal
