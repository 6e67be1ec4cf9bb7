#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "platform/clock.h"
#include "platform/disk_budget.h"
#include "platform/kept_store.h"
#include "platform/work_queue.h"

namespace zal {

class AgentLog;
struct Platform;

/// Keeps what the agent has on the disk within its budget: looks at it in the background and removes what
/// has to go, one line in the log each. Any thread; the platform outlives it, and it outlives its jobs.
class DiskBudgetKeeper {
 public:
  /// After a start, time for the sessions and collections of former agents to be taken up again.
  static constexpr std::chrono::seconds kFirstLook{3};

  explicit DiskBudgetKeeper(Platform& platform);
  DiskBudgetKeeper(const DiskBudgetKeeper&) = delete;
  DiskBudgetKeeper& operator=(const DiskBudgetKeeper&) = delete;

  /// Looks soon, and once however often it was asked for until then.
  void look();
  /// The first look, which a start asks for.
  void lookLater();
  /// Whether a dump of that type may take all that was asked for; else only what is small or gone soon. As
  /// far as the last look knew, and what is free now. Where room can be made for the dump, it is from here
  /// on. Does not wait for a disk.
  [[nodiscard]] bool admits(std::string_view type);
  /// The directory, and the archive that it becomes, stay as long as this is held.
  [[nodiscard]] std::shared_ptr<void> hold(const std::string& directory);

 private:
  void _lookNow();
  bool _evict(std::vector<KeptItem>& items, std::uint64_t reserve);
  void _markHeld(std::vector<KeptItem>& items);
  void _tell(const KeptItem& item, Eviction::Reason reason, const DiskLimits& limits);
  void _tellFailure(const KeptItem& item, const std::error_code& error);
  void _remember(const std::vector<KeptItem>& items);

  /// Those who hold something may outlive the keeper.
  struct Held {
    std::mutex mutex;
    std::multiset<std::string> directories;  // guarded by mutex
  };

  const DiskSettings _settings;
  const std::string _home;
  KeptStore& _store;
  const Clock& _clock;
  AgentLog& _log;
  WorkQueue& _queue;
  const std::shared_ptr<Held> _held = std::make_shared<Held>();
  std::mutex _looking;  // one look at a time
  // Guarded by _looking.
  std::set<std::string> _stubborn;  // told already that they could not be removed

  std::mutex _mutex;
  // Guarded by _mutex from here on.
  bool _isAsked = false;
  std::uint64_t _reserve = 0;
  DiskUse _use;                                                // at the end of the last look
  std::map<std::string, std::uint64_t, std::less<>> _largest;  // item of each type, then
};

}  // namespace zal
