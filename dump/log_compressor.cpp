#include "dump/log_compressor.h"

#include <filesystem>
#include <string_view>
#include <system_error>
#include <utility>

#include "collectors/file_url.h"
#include "dump/several_attempts.h"
#include "platform/agent_log.h"
#include "platform/file_placement.h"
#include "platform/work_queue.h"

namespace zal {
namespace {

// Leaves room for the random part within what a file name may hold.
constexpr std::size_t kLongestTemporarySuffix = 200;

struct SharedCompressor {
  explicit SharedCompressor(const _LirraLogCompressor::Services& services) : madeOf(services) {}
  _LirraLogCompressor::Services madeOf;
  std::unique_ptr<_LirraLogCompressor> instance;
  std::once_flag first, second, third;
};

std::mutex sharedLock;
std::shared_ptr<SharedCompressor> sharedCompressor;  // guarded by sharedLock

std::string withoutEndSlashes(std::string path) {
  while (path.size() > 1 && path.back() == '/') path.pop_back();
  return path;
}

std::string lastComponent(const std::string& path) {
  return std::filesystem::path(withoutEndSlashes(path)).filename().string();
}

// The end of the name, as much of it as fits, without half a character.
std::string temporarySuffix(std::string name) {
  if (name.size() <= kLongestTemporarySuffix) return name;
  std::size_t start = name.size() - kLongestTemporarySuffix;
  while (start < name.size() && (static_cast<unsigned char>(name[start]) & 0xC0U) == 0x80U) ++start;
  return name.substr(start);
}

/// Not to be written any more, it is no leftover of who made it. False when there is none.
bool keepInTemporaryArea(const std::string& archive) {
  using std::filesystem::perms;
  std::error_code error;
  std::filesystem::permissions(archive, perms::owner_read | perms::group_read, error);
  return !error;
}

std::string locationText(const std::optional<std::string>& path) { return path ? fileUrl(*path) : "nil"; }

}  // namespace

_LirraLogCompressor::_LirraLogCompressor(const Services& services) : _services(services) {}

_LirraLogCompressor::~_LirraLogCompressor() = default;

void _LirraLogCompressor::lendServices(const Services* services) {
  const auto fresh = services != nullptr ? std::make_shared<SharedCompressor>(*services) : nullptr;
  const std::scoped_lock lock(sharedLock);
  sharedCompressor = fresh;
}

_LirraLogCompressor* _LirraLogCompressor::sharedInstance() {
  std::shared_ptr<SharedCompressor> shared;
  {
    const std::scoped_lock lock(sharedLock);
    shared = sharedCompressor;
  }
  if (!shared) return nullptr;
  std::call_once(shared->first,
                 [&] { shared->instance = std::make_unique<_LirraLogCompressor>(shared->madeOf); });
  // Places for what the compressor may come to need: nothing yet.
  std::call_once(shared->second, [] {});
  std::call_once(shared->third, [] {});
  return shared->instance.get();
}

void _LirraLogCompressor::compressDirectory(const std::optional<std::string>& directory,
                                            const std::optional<std::string>& archive,
                                            std::function<void()> completion, ArchiveEnding ending) {
  if (!directory || !archive) {
    if (completion) completion();
    return;
  }
  const std::string temporary = _services.files.randomTemporaryPath(temporarySuffix(lastComponent(*archive)));
  const auto job = _services.copier.makeJob(
      *directory, temporary, *directory, CopierOperation::compressIntoZip, _services.queues.main(),
      [this, temporary, archivePath = *archive,
       completion = std::move(completion)](FileCopierJob& finished) mutable {
        _settle(finished, temporary, archivePath, std::move(completion));
      });
  job->endWith(std::move(ending));
  {
    const std::scoped_lock lock(_lock);
    _archivers.push_back(job);
  }
  job->start();
}

// Moving to another file system and deleting a large tree take their time, and the main thread
// serves clients: it only keeps the books.
void _LirraLogCompressor::_settle(FileCopierJob& job, const std::string& temporary,
                                  const std::string& archive, std::function<void()> completion) {
  _services.queues.global(QueuePriority::standard)
      .async([this, &job, temporary, archive, completion = std::move(completion)]() mutable {
        FilePlacement& files = _services.files;
        const std::error_code error = inSeveralAttempts([&] { return files.move(temporary, archive); });
        const bool isKept = error && keepInTemporaryArea(temporary);
        if (isKept) {
          _services.log.warning("\"" + archive + "\" could not be put in its place (" + error.message() +
                                "); for a day it is kept as \"" + temporary + '"');
        }
        // What is in no archive stays. Without a slash at the end: with one, a link would be followed.
        if (!error || isKept)
          inSeveralAttempts([&] { return files.remove(withoutEndSlashes(job.identifier())); });
        _services.queues.main().async([this, &job, completion = std::move(completion)] {
          const auto released = _take(job);
          if (completion) completion();
        });
      });
}

std::shared_ptr<FileCopierJob> _LirraLogCompressor::_take(const FileCopierJob& job) {
  const std::scoped_lock lock(_lock);
  for (auto it = _archivers.begin(); it != _archivers.end(); ++it) {
    if (it->get() != &job) continue;
    auto found = std::move(*it);
    _archivers.erase(it);
    return found;
  }
  return nullptr;
}

std::size_t _LirraLogCompressor::runningJobs() const {
  const std::scoped_lock lock(_lock);
  return _archivers.size();
}

bool CompressDirectory(_LirraLogCompressor& compressor, AgentLog& log,
                       const std::optional<std::string>& directory, const std::optional<std::string>& archive,
                       ArchiveCompletion completion, ArchiveEnding ending) {
  log.notice("Compressing " + locationText(directory) + " into " + locationText(archive));
  if (!directory) {
    if (completion) completion(std::nullopt);
    return false;
  }
  const std::string target = archive ? *archive : withoutEndSlashes(*directory) + ".zip";
  log.notice("Starting zip of " + fileUrl(*directory) + " => " + fileUrl(target));
  compressor.compressDirectory(
      *directory, target,
      [&log, target, completion = std::move(completion)] {
        log.notice("Done zipping log to path: " + fileUrl(target));
        if (completion) completion(target);
      },
      std::move(ending));
  return true;
}

}  // namespace zal
