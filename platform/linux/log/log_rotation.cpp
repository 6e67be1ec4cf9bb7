#include "platform/linux/log/log_rotation.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <filesystem>
#include <map>
#include <optional>

#include "platform/linux/files/rename_no_replace.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/log/rotation_names.h"
#include "platform/linux/log/zip_file.h"

namespace zal {
namespace {

using Kind = RotationLeftover::Kind;

struct Waiting {
  bool isPending = false;
  bool isReady = false;
};

std::error_code renameFile(const std::string& from, const std::string& to) {
  return ::rename(from.c_str(), to.c_str()) == 0 ? std::error_code{} : lastSystemError();
}

std::error_code removeFile(const std::string& path) {
  return ::unlink(path.c_str()) == 0 || errno == ENOENT ? std::error_code{} : lastSystemError();
}

/// Makes renames and removals in the directory outlive a power cut, in this order.
std::error_code syncDirectory(const std::string& directory) {
  const int descriptor = ::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (descriptor < 0) return lastSystemError();
  const std::error_code error = ::fsync(descriptor) == 0 ? std::error_code{} : lastSystemError();
  ::close(descriptor);
  return error;
}

template <class Visit>
std::error_code forEachLeftover(const std::string& directory, const Visit& visit) {
  std::error_code error;
  for (std::filesystem::directory_iterator entry(directory, error), end; !error && entry != end;
       entry.increment(error)) {
    if (const auto leftover = parseRotationLeftover(entry->path().filename().string())) visit(*leftover);
  }
  return error;
}

/// The rotation of one log file, step by step. Each step may be the last one of a process.
class Rotation {
 public:
  explicit Rotation(const UnfinishedRotation& rotation)
      : _directory(rotation.directory), _name(rotation.fileName) {}

  std::error_code complete() {
    if (const auto error = removeFile(_path(unfinishedZipName(_name)))) return error;
    for (;;) {
      std::map<std::uint64_t, Waiting> waiting;
      if (const auto error = _list(waiting)) return error;
      if (waiting.empty()) return {};
      if (const auto error = _removeSuperfluous(waiting)) return error;
      if (const auto error = _completeOne(waiting.begin()->first, waiting.begin()->second)) return error;
    }
  }

 private:
  [[nodiscard]] std::string _path(const std::string& name) const { return _directory + "/" + name; }

  std::error_code _list(std::map<std::uint64_t, Waiting>& waiting) const {
    return forEachLeftover(_directory, [&](const RotationLeftover& leftover) {
      if (leftover.fileName != _name || leftover.kind == Kind::unfinishedZip) return;
      Waiting& entry = waiting[leftover.sequence];
      (leftover.kind == Kind::ready ? entry.isReady : entry.isPending) = true;
    });
  }

  std::error_code _removeSuperfluous(std::map<std::uint64_t, Waiting>& waiting) const {
    while (waiting.size() > kGenerations) {
      const std::uint64_t oldest = waiting.begin()->first;
      if (const auto error = removeFile(_path(pendingName(_name, oldest)))) return error;
      if (const auto error = removeFile(_path(readyName(_name, oldest)))) return error;
      waiting.erase(waiting.begin());
    }
    return {};
  }

  std::error_code _completeOne(std::uint64_t sequence, Waiting waiting) const {
    const std::string pending = _path(pendingName(_name, sequence));
    const std::string ready = _path(readyName(_name, sequence));
    if (!waiting.isReady) {
      const std::string unfinished = _path(unfinishedZipName(_name));
      if (const auto error = packIntoZip(pending, unfinished, _name)) return error;
      if (const auto error = renameFile(unfinished, ready)) return error;
      if (const auto error = syncDirectory(_directory)) return error;
    }
    if (const auto error = removeFile(pending)) return error;
    if (const auto error = _shiftGenerations()) return error;
    return renameFile(ready, _path(generationName(_name, 1)));
  }

  /// Makes the first generation's place free. The first free place is where an earlier shift was cut
  /// off, or where the shift may end: what lies beyond it stays. Without one the oldest is pushed out.
  std::error_code _shiftGenerations() const {
    int freePlace = 1;
    std::error_code error;
    while (freePlace < kGenerations && nameIsTaken(_path(generationName(_name, freePlace)), error))
      ++freePlace;
    if (error) return error;  // what cannot be seen may be there, and would be overwritten
    for (int place = freePlace; place > 1; --place) {
      const std::string from = _path(generationName(_name, place - 1));
      if (const auto failure = renameFile(from, _path(generationName(_name, place)))) return failure;
    }
    return {};
  }

  const std::string& _directory;
  const std::string& _name;
};

}  // namespace

UnfinishedRotations findUnfinishedRotations(const std::string& userLogRoot) {
  UnfinishedRotations found;
  std::error_code error;
  for (std::filesystem::directory_iterator set(userLogRoot, error), end; !error && set != end;
       set.increment(error)) {
    std::error_code ignored;
    if (!set->is_directory(ignored)) continue;
    const std::string directory = set->path().string();
    const std::string setName = set->path().filename().string();
    forEachLeftover(directory, [&](const RotationLeftover& leftover) {
      if (leftover.fileName != setName + ".log" && leftover.fileName != setName + "-Event.log") return;
      found.highestSequence = std::max(found.highestSequence, leftover.sequence);
      found.files.push_back({directory, leftover.fileName});
    });
  }
  const auto key = [](const UnfinishedRotation& rotation) {
    return rotation.directory + "/" + rotation.fileName;
  };
  std::sort(found.files.begin(), found.files.end(),
            [&](const auto& left, const auto& right) { return key(left) < key(right); });
  found.files.erase(std::unique(found.files.begin(), found.files.end()), found.files.end());
  return found;
}

std::error_code completeRotations(const UnfinishedRotation& rotation) {
  return Rotation(rotation).complete();
}

}  // namespace zal
