#pragma once

#include <array>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "platform/agent_log.h"
#include "platform/clock.h"
#include "platform/configuration.h"
#include "platform/linux/log/log_rotation.h"
#include "platform/linux/log/record_time.h"
#include "platform/linux/log/rotating_log_file.h"
#include "platform/log_facility.h"
#include "platform/main_thread_check.h"
#include "platform/run_loop.h"
#include "platform/work_queue.h"

namespace zal {

/// Log sets as files: `root`/<set>/<set>.log and <set>-Event.log with their zipped generations.
/// docs/log-format.md says what stands in them. Rotations that an earlier process did not end are
/// ended on the background queue, one after the other.
class FileLogFacility : public PlatformLogFacility {
 public:
  /// All borrowed; the loop and the agent log outlive this, the agent log and the root's files also
  /// the jobs that were handed to the queues.
  struct Host {
    Clock& clock;
    RunLoop& mainLoop;
    WorkQueues& queues;
    AgentLog& log;
  };
  FileLogFacility(Host host, std::string userLogRoot, const LogSettings& settings);
  ~FileLogFacility() override;

  void record(const LogRecord& record) override;
  void flush() override;

  [[nodiscard]] std::size_t openFiles() const;

 private:
  struct TextHash : std::hash<std::string_view> {
    using is_transparent = void;
  };
  using Files = std::unordered_map<std::string, std::unique_ptr<RotatingLogFile>, TextHash, std::equal_to<>>;
  struct LastHit {
    std::string type;
    RotatingLogFile* file = nullptr;
  };

  RotatingLogFile* _fileFor(const LogRecord& record);
  RotatingLogFile* _findOrMake(const std::string& setName, bool isEvent);
  bool _makeRoom();
  bool _evict(bool isEvent, Files::iterator found);
  void _markDirty(RotatingLogFile& file);
  void _rotate(RotatingLogFile& file);
  void _schedule(const UnfinishedRotation& rotation, std::chrono::nanoseconds delay);
  void _flushDirty();
  void _keepSpareBuffer(RotatingLogFile& file);
  void _deliverMessages();

  Host _host;
  std::string _root;
  LogSettings _settings;
  RecordTime _time;
  std::string _processText;
  std::array<Files, 2> _files;  // records, events
  std::array<LastHit, 2> _lastHit;
  std::vector<RotatingLogFile*> _dirty;
  std::string _spareBuffer;
  std::uint64_t _uses = 0;
  std::uint64_t _lastSequence = 0;
  SteadyTime _lastRotation{};
  std::uint64_t _refused = 0;  // records of sets for which there was no room
  std::vector<std::string> _messages;
  bool _isDelivering = false;
  std::unique_ptr<WorkQueue> _rotations;
  ScopedTimer _retry;
  MainThreadCheck _mainThread;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);
};

}  // namespace zal
