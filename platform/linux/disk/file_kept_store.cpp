#include "platform/linux/disk/file_kept_store.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <cerrno>
#include <optional>
#include <utility>

#include "platform/linux/disk/archive_parts.h"
#include "platform/linux/disk/open_elsewhere.h"
#include "platform/linux/disk/report_walk.h"
#include "platform/linux/disk/unnamed_files.h"
#include "platform/linux/files/changed_at.h"
#include "platform/linux/files/directory_tree.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/files/temporary_area.h"
#include "platform/linux/files/whole_file.h"
#include "platform/linux/progress/progress_file.h"

namespace zal {
namespace {

/// One that is longer is no small thing to keep for a year.
constexpr std::uint64_t kLongestStub = 1U << 20U;
constexpr std::size_t kLogStart = 256U << 10U;
constexpr std::string_view kRecord = ".session";
constexpr std::string_view kDamagedRecord = ".session.damaged";
constexpr int kOpenFile = O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;

/// A root's own path may lead through links; what is below it may not.
Descriptor openRoot(const std::string& path) {
  return Descriptor(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
}

std::optional<FileId> idOf(const std::string& path) {
  struct stat status {};
  if (::stat(path.c_str(), &status) != 0) return std::nullopt;
  return FileId{status.st_dev, status.st_ino};
}

ReportsInUse reportsInUse(const std::string& progress, const std::string& userLogs) {
  ReportsInUse inUse;
  for (const ListedDumpProgress& listed : listDumpProgress(progress)) {
    if (listed.record.state != DumpProgressRecord::State::running) continue;
    for (const char* ending : {"", ".zip"}) {
      if (const auto id = idOf(listed.record.directory + ending)) inUse.collected.insert(*id);
    }
  }
  const Descriptor logs = openRoot(userLogs);
  for (const std::string& type : namesAt(logs.get())) {
    if (const auto id = idOf(userLogs + "/" + type + "/Latest-" + type)) inUse.linked.insert(*id);
  }
  return inUse;
}

/// The directory that something lies in, by the way down from its root, and its name there.
struct Lying {
  Descriptor directory;
  std::string name;
};

Lying lyingOf(const std::string& root, const std::string& path) {
  Lying lying;
  if (!path.starts_with(root + "/")) return lying;
  lying.directory = openRoot(root);
  std::string below = path.substr(root.size() + 1);
  for (std::size_t slash = below.find('/'); slash != std::string::npos; slash = below.find('/')) {
    lying.directory = openDirectoryAt(lying.directory.get(), below.substr(0, slash));
    if (!lying.directory.isOpen()) return lying;
    below.erase(0, slash + 1);
  }
  lying.name = std::move(below);
  return lying;
}

std::string startOf(int file) {
  std::string text(kLogStart, '\0');
  const ssize_t got = ::pread(file, text.data(), text.size(), 0);
  text.resize(got > 0 ? static_cast<std::size_t>(got) : 0);
  return text;
}

std::string sessionLogStartIn(int directory) {
  for (const std::string& name : namesAt(directory)) {
    if (!isSessionLogName(name)) continue;
    const Descriptor file(::openat(directory, name.c_str(), kOpenFile));
    if (file.isOpen()) return startOf(file.get());
  }
  return "";
}

}  // namespace

FileKeptStore::FileKeptStore(Places places, FilePlacement& files)
    : _places(std::move(places)), _files(files) {}

DiskRoom FileKeptStore::room() const {
  struct statvfs status {};
  if (::statvfs(_places.reports.c_str(), &status) != 0) return {};
  return {status.f_blocks * status.f_frsize, status.f_bavail * status.f_frsize};
}

std::vector<KeptItem> FileKeptStore::items() {
  const Descriptor reports = openRoot(_places.reports);
  std::vector<KeptItem> items;
  if (reports.isOpen()) {
    items = walkReports(reports.get(), _places.reports, reportsInUse(_places.progress, _places.userLogs));
    _addTemporary(reports.get(), items);
  }
  _addRecords(items);
  _addSpilledLines(items);
  return items;
}

void FileKeptStore::_addRecords(std::vector<KeptItem>& items) const {
  struct stat reports {};
  const bool isKnown = ::stat(_places.reports.c_str(), &reports) == 0;
  const Descriptor directory = openRoot(_places.blackBox);
  for (const std::string& name : namesAt(directory.get())) {
    struct stat status {};
    if (name.find(kRecord) == std::string::npos ||
        ::fstatat(directory.get(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0 ||
        !S_ISREG(status.st_mode) || status.st_uid != ::geteuid()) {
      continue;
    }
    KeptItem item;
    item.kind = KeptKind::record;
    item.path = _places.blackBox + "/" + name;
    item.bytes = diskBytesAt(directory.get(), name);
    item.changed = changedAt(status);
    item.isElsewhere = !isKnown || status.st_dev != reports.st_dev;
    if (!name.ends_with(kDamagedRecord)) item.inUse = "a session goes on or is to be recovered";
    items.push_back(std::move(item));
  }
}

void FileKeptStore::_addSpilledLines(std::vector<KeptItem>& items) const {
  struct stat reports {};
  const bool isKnown = ::stat(_places.reports.c_str(), &reports) == 0;
  for (UnnamedFile& file : unnamedFilesIn(_places.blackBox)) {
    KeptItem item;
    item.kind = KeptKind::temporary;
    item.path = std::move(file.path);
    item.bytes = static_cast<std::uint64_t>(file.status.st_blocks) * kBytesOfBlock;
    item.changed = changedAt(file.status);
    item.isElsewhere = !isKnown || file.status.st_dev != reports.st_dev;
    item.inUse = "lines of a session that goes on";
    items.push_back(std::move(item));
  }
}

void FileKeptStore::_addTemporary(int reports, std::vector<KeptItem>& items) const {
  for (const std::string& areaName : temporaryAreaNames(_places.temporaryArea)) {
    const Descriptor area = openDirectoryAt(reports, areaName);
    const bool isDeserted = holdDeserted(reports, areaName).isOpen();
    for (const std::string& name : namesAt(area.get())) {
      struct stat status {};
      if (::fstatat(area.get(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) continue;
      if (status.st_uid != ::geteuid()) continue;
      KeptItem item;
      item.kind = KeptKind::temporary;
      item.path = _places.reports + "/" + areaName + "/" + name;
      item.bytes = diskBytesAt(area.get(), name);
      item.changed = changedAt(status);
      // What may not be written any more is an archive for which there was no other place.
      item.isLeftover = isDeserted && !(S_ISREG(status.st_mode) && (status.st_mode & S_IWUSR) == 0);
      if (!isDeserted) item.inUse = "being written";
      items.push_back(std::move(item));
    }
  }
}

void FileKeptStore::findFailed(std::vector<KeptItem>& items) {
  for (KeptItem& item : items) {
    if (item.kind != KeptKind::session) continue;
    const Lying lying = lyingOf(_places.reports, item.path);
    const Descriptor opened(::openat(lying.directory.get(), lying.name.c_str(), kOpenFile));
    if (!opened.isOpen()) continue;
    const std::string log =
        item.isDirectory ? sessionLogStartIn(opened.get()) : sessionLogStart(opened.get());
    item.hasFailed = hasFailureReason(log);
  }
}

std::error_code FileKeptStore::remove(const KeptItem& item) {
  const Lying lying = lyingOf(item.kind == KeptKind::record ? _places.blackBox : _places.reports, item.path);
  if (!lying.directory.isOpen()) return lastSystemError();
  if (item.isDirectory || item.kind == KeptKind::temporary) {
    return removeTreeAt(lying.directory.get(), lying.name);
  }
  Descriptor file(::openat(lying.directory.get(), lying.name.c_str(), kOpenFile));
  if (!file.isOpen()) return errno == ENOENT ? std::error_code() : lastSystemError();
  if (isOpenElsewhere(file.get())) return std::make_error_code(std::errc::device_or_resource_busy);
  const bool mayLeaveStub = item.kind == KeptKind::session || item.kind == KeptKind::dump;
  const auto manifest = mayLeaveStub ? manifestIn(file.get(), kLongestStub) : std::nullopt;
  const bool isLeft = manifest && _leaveStub(lying.directory.get(), lying.name, *manifest);
  if (::unlinkat(lying.directory.get(), lying.name.c_str(), 0) != 0) return lastSystemError();
  file = {};
  // A disk that had no room for it has some now.
  if (manifest && !isLeft) static_cast<void>(_leaveStub(lying.directory.get(), lying.name, *manifest));
  return {};
}

bool FileKeptStore::_leaveStub(int directory, const std::string& archive, std::string_view manifest) {
  const std::string temporary = _files.randomTemporaryPath("");
  if (placeWholeFile(temporary, manifest, ExistingFile::stays)) return false;
  // Not a rename: that would take the place of what has the name.
  const bool isLeft = ::linkat(AT_FDCWD, temporary.c_str(), directory, stubPathOf(archive).c_str(), 0) == 0 ||
                      errno == EEXIST;
  ::unlink(temporary.c_str());
  return isLeft;
}

}  // namespace zal
