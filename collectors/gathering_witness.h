#pragma once

#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace zal {

/// What became of a source that was to be gathered.
enum class SourceOutcome {
  taken,
  absent,  ///< there is no such thing
  failed,
};

/// Hears what is gathered below a directory. Any thread, several at once.
class GatheringWitness {
 public:
  virtual ~GatheringWitness() = default;
  /// A file or directory that was to go into the directory; `why` when it failed.
  virtual void source(const std::string& source, const std::string& directory, SourceOutcome outcome,
                      const std::string& why) = 0;
  /// A command that was started, or has ended when its status is known: as POSIX wait() gives it.
  virtual void command(std::string_view commandLine, const std::string& outputFile,
                       std::optional<int> waitStatus) = 0;
};

/// The witnesses of all directories that are being filled. Collectors tell it what they do and need not
/// know for whom. Any thread.
class GatheringWitnesses {
 public:
  /// Until it is gone. The directory as the collectors' paths begin.
  void add(std::string directory, std::weak_ptr<GatheringWitness> witness);

  void source(const std::string& source, const std::string& directory, SourceOutcome outcome,
              const std::string& why = {}) const;
  void command(std::string_view commandLine, std::string_view directory, std::string_view fileName,
               std::optional<int> waitStatus) const;

 private:
  struct Entry {
    std::string directory;
    std::weak_ptr<GatheringWitness> witness;
  };
  [[nodiscard]] std::vector<std::shared_ptr<GatheringWitness>> _of(std::string_view directory) const;

  mutable std::mutex _mutex;
  std::vector<Entry> _entries;  // guarded by _mutex
};

}  // namespace zal
