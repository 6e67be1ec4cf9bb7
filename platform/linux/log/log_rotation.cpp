#include "platform/linux/log/log_rotation.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <filesystem>
#include <map>
#include <optional>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/directory_tree.h"
#include "platform/linux/files/file_copy.h"
#include "platform/linux/files/rename_no_replace.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/log/log_set_directory.h"
#include "platform/linux/log/rotation_names.h"
#include "platform/linux/log/zip_file.h"

namespace zal {
namespace {

using Kind = RotationLeftover::Kind;

struct Waiting {
  bool isPending = false;
  bool isReady = false;
};

template <class Visit>
std::error_code forEachLeftover(int directory, const Visit& visit) {
  std::error_code error;
  for (const std::string& name : namesAt(directory, error)) {
    if (const auto leftover = parseRotationLeftover(name)) visit(*leftover);
  }
  return error;
}

/// The rotation of one log file, step by step. Each step may be the last one of a process.
class Rotation {
 public:
  explicit Rotation(const UnfinishedRotation& rotation)
      : _directory(openLogSet(rotation.directory)), _name(rotation.fileName) {}

  std::error_code complete() {
    if (!_directory.isOpen()) return lastSystemError();
    if (const auto error = _remove(unfinishedZipName(_name))) return error;
    for (;;) {
      std::map<std::uint64_t, Waiting> waiting;
      if (const auto error = _list(waiting)) return error;
      if (waiting.empty()) return {};
      if (const auto error = _removeSuperfluous(waiting)) return error;
      if (const auto error = _completeOne(waiting.begin()->first, waiting.begin()->second)) return error;
    }
  }

 private:
  [[nodiscard]] std::error_code _rename(const std::string& from, const std::string& to) const {
    const int directory = _directory.get();
    return ::renameat(directory, from.c_str(), directory, to.c_str()) == 0 ? std::error_code{}
                                                                           : lastSystemError();
  }

  [[nodiscard]] std::error_code _remove(const std::string& name) const {
    const bool isGone = ::unlinkat(_directory.get(), name.c_str(), 0) == 0 || errno == ENOENT;
    return isGone ? std::error_code{} : lastSystemError();
  }

  std::error_code _list(std::map<std::uint64_t, Waiting>& waiting) const {
    return forEachLeftover(_directory.get(), [&](const RotationLeftover& leftover) {
      if (leftover.fileName != _name || leftover.kind == Kind::unfinishedZip) return;
      Waiting& entry = waiting[leftover.sequence];
      (leftover.kind == Kind::ready ? entry.isReady : entry.isPending) = true;
    });
  }

  std::error_code _removeSuperfluous(std::map<std::uint64_t, Waiting>& waiting) const {
    while (waiting.size() > kGenerations) {
      const std::uint64_t oldest = waiting.begin()->first;
      if (const auto error = _remove(pendingName(_name, oldest))) return error;
      if (const auto error = _remove(readyName(_name, oldest))) return error;
      waiting.erase(waiting.begin());
    }
    return {};
  }

  std::error_code _completeOne(std::uint64_t sequence, Waiting waiting) const {
    const std::string pending = pendingName(_name, sequence);
    const std::string ready = readyName(_name, sequence);
    if (!waiting.isReady) {
      const std::string unfinished = unfinishedZipName(_name);
      if (const auto error = packIntoZip(_directory.get(), pending, unfinished, _name)) return error;
      if (const auto error = _rename(unfinished, ready)) return error;
      // Renames and removals outlive a power cut in this order.
      if (const auto error = syncDirectoryAt(_directory.get())) return error;
    }
    if (const auto error = _remove(pending)) return error;
    if (const auto error = _shiftGenerations()) return error;
    return _rename(ready, generationName(_name, 1));
  }

  /// Makes the first generation's place free. The first free place is where an earlier shift was cut
  /// off, or where the shift may end: what lies beyond it stays. Without one the oldest is pushed out.
  std::error_code _shiftGenerations() const {
    int freePlace = 1;
    std::error_code error;
    while (freePlace < kGenerations &&
           nameIsTakenAt(_directory.get(), generationName(_name, freePlace), error))
      ++freePlace;
    if (error) return error;  // what cannot be seen may be there, and would be overwritten
    for (int place = freePlace; place > 1; --place) {
      const std::string from = generationName(_name, place - 1);
      if (const auto failure = _rename(from, generationName(_name, place))) return failure;
    }
    return {};
  }

  const Descriptor _directory;
  const std::string& _name;
};

}  // namespace

UnfinishedRotations findUnfinishedRotations(const std::string& userLogRoot) {
  UnfinishedRotations found;
  std::error_code error;
  for (std::filesystem::directory_iterator set(userLogRoot, error), end; !error && set != end;
       set.increment(error)) {
    const std::string directory = set->path().string();
    const Descriptor opened = openLogSet(directory);
    if (!opened.isOpen()) continue;
    const std::string setName = set->path().filename().string();
    forEachLeftover(opened.get(), [&](const RotationLeftover& leftover) {
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
