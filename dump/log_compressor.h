#pragma once

#include <functional>
#include <list>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "platform/file_copier.h"

namespace zal {

class AgentLog;
class FilePlacement;
class WorkQueues;

/// Turns gathered directories into zip archives: drives the host's file copier, keeps each running
/// job alive, moves the finished archive into place and deletes the source directory. Requests may
/// come from any thread; completions run on the main thread. The services are borrowed and outlive
/// every job.
class _LirraLogCompressor {
 public:
  struct Services {
    AgentLog& log;
    FileCopier& copier;
    FilePlacement& files;
    WorkQueues& queues;
  };
  explicit _LirraLogCompressor(const Services& services);
  ~_LirraLogCompressor();
  _LirraLogCompressor(const _LirraLogCompressor&) = delete;
  _LirraLogCompressor& operator=(const _LirraLogCompressor&) = delete;

  /// The process's one compressor; null until the entry has named what it is made of.
  [[nodiscard]] static _LirraLogCompressor* sharedInstance();
  /// For the entry: what the shared compressor is made of at its first use. Null takes it back.
  static void lendServices(const Services* services);

  /// The completion runs once: at once when a path is missing, else after the source directory is
  /// deleted. An archive that exists at the path stays, and the fresh one stays in the temporary
  /// area. How the job went is not looked at: the copier sees to it that nothing gathered is lost.
  void compressDirectory(const std::optional<std::string>& directory,
                         const std::optional<std::string>& archive, std::function<void()> completion,
                         ArchiveEnding ending = {});

  [[nodiscard]] std::size_t runningJobs() const;

 private:
  void _settle(FileCopierJob& job, const std::string& temporary, const std::string& archive,
               std::function<void()> completion);
  std::shared_ptr<FileCopierJob> _take(const FileCopierJob& job);

  Services _services;
  mutable std::mutex _lock;  ///< guards _archivers: they come from any thread and go on the main one
  std::list<std::shared_ptr<FileCopierJob>> _archivers;
};

/// Receives where the archive lies; nothing when there was no directory.
using ArchiveCompletion = std::function<void(const std::optional<std::string>& archive)>;

/// Compresses a directory into the archive, by default a sibling with ".zip" appended, with the ending
/// as its last entry where there is one. Returned: whether a directory was given; without one the
/// completion is told so at once.
bool CompressDirectory(_LirraLogCompressor& compressor, AgentLog& log,
                       const std::optional<std::string>& directory, const std::optional<std::string>& archive,
                       ArchiveCompletion completion, ArchiveEnding ending = {});

}  // namespace zal
