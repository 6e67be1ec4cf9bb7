#include "platform/linux/files/temporary_leftovers.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>

#include "platform/agent_log.h"
#include "platform/linux/files/changed_at.h"
#include "platform/linux/files/directory_tree.h"
#include "platform/linux/files/temporary_area.h"
#include "platform/work_queue.h"

namespace zal {
namespace {

constexpr std::chrono::seconds kDelay{1};
constexpr std::chrono::hours kKept{24};

bool isKept(int area, const std::string& name, WallTime now) {
  struct stat status {};
  if (::fstatat(area, name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) return false;
  return S_ISREG(status.st_mode) && (status.st_mode & S_IWUSR) == 0 && now - changedAt(status) <= kKept;
}

}  // namespace

std::size_t removeTemporaryLeftovers(const std::string& base, WallTime now) {
  const std::string parentPath = std::filesystem::path(base).parent_path().string();
  const Descriptor parent(::open(parentPath.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  std::size_t removed = 0;
  for (const std::string& name : temporaryAreaNames(base)) {
    const Descriptor area = holdDeserted(parent.get(), name);
    if (!area.isOpen()) continue;
    for (const std::string& left : namesAt(area.get())) {
      if (!isKept(area.get(), left, now) && !removeTreeAt(area.get(), left)) ++removed;
    }
    // It goes while its lock is held, so that nobody begins to use it meanwhile.
    ::unlinkat(parent.get(), name.c_str(), AT_REMOVEDIR);
  }
  return removed;
}

void removeTemporaryLeftoversLater(WorkQueue& queue, const Clock& clock, AgentLog& log,
                                   const std::string& base) {
  if (temporaryAreaNames(base).empty()) return;  // the usual case; saves the job and its thread
  queue.asyncAfter(kDelay, [&clock, &log, base] {
    const std::size_t removed = removeTemporaryLeftovers(base, clock.wallNow());
    if (removed == 0) return;
    log.notice("Leftovers of earlier runs removed from " + base + ": " + std::to_string(removed));
  });
}

}  // namespace zal
