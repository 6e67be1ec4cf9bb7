#include "platform/linux/disk/report_walk.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <optional>

#include "platform/linux/disk/open_elsewhere.h"
#include "platform/linux/files/changed_at.h"
#include "platform/linux/files/directory_tree.h"

namespace zal {
namespace {

constexpr int kDeepestReport = 4;

class ReportWalk {
 public:
  explicit ReportWalk(const ReportsInUse& inUse) : _inUse(inUse) {}

  void walk(int directory, const std::string& path, const std::string& type, int level) {
    for (const std::string& name : namesAt(directory)) {
      struct stat status {};
      if (name.starts_with('.') || ::fstatat(directory, name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0)
        continue;
      const std::string below = path + "/" + name;
      const auto kept = level > 0 ? keptNameOf(name) : std::nullopt;
      if (kept && _isAsNamed(*kept, status)) {
        if (status.st_uid == ::geteuid()) _add(directory, name, below, type, *kept, status);
      } else if (S_ISDIR(status.st_mode) && level < kDeepestReport) {
        const Descriptor opened = openDirectoryAt(directory, name);
        if (opened.isOpen()) walk(opened.get(), below, level == 0 ? name : type, level + 1);
      }
    }
  }
  std::vector<KeptItem> items;

 private:
  static bool _isAsNamed(const KeptName& kept, const struct stat& status) {
    return kept.isArchive || kept.kind == KeptKind::stub ? S_ISREG(status.st_mode) : S_ISDIR(status.st_mode);
  }

  void _add(int directory, const std::string& name, const std::string& path, const std::string& type,
            const KeptName& kept, const struct stat& status) {
    KeptItem item;
    item.kind = kept.kind;
    item.type = type;
    item.path = path;
    item.bytes = diskBytesAt(directory, name);
    item.changed = changedAt(status);
    item.isDirectory = S_ISDIR(status.st_mode);
    const FileId id{status.st_dev, status.st_ino};
    if (_inUse.collected.contains(id)) {
      item.inUse = "being collected";
    } else if (_inUse.linked.contains(id)) {
      item.inUse = "the latest of its type";
    } else if (kept.kind != KeptKind::stub && _isBusy(directory, name, item.isDirectory)) {
      item.inUse = "open or locked";
    }
    items.push_back(std::move(item));
  }

  static bool _isBusy(int directory, const std::string& name, bool isDirectory) {
    const Descriptor opened(
        ::openat(directory, name.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    if (!opened.isOpen()) return false;
    // What lies in a directory has other names too, under which it may well be open.
    if (!isDirectory) return isOpenElsewhere(opened.get());
    return ::flock(opened.get(), LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK;
  }

  const ReportsInUse& _inUse;
};

}  // namespace

std::vector<KeptItem> walkReports(int directory, const std::string& path, const ReportsInUse& inUse) {
  ReportWalk walk(inUse);
  walk.walk(directory, path, "", 0);
  return std::move(walk.items);
}

}  // namespace zal
