#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace zal {

/// What a collection is going to do.
struct DumpPlan {
  std::string service;             ///< session type
  std::string directory;           ///< that is being filled
  std::vector<std::string> steps;  ///< their names, in order, as people read them
};

/// The record of one collection while it is being made, for whoever watches it; it survives the
/// agent. Any thread; never fails towards the caller.
class DumpProgress {
 public:
  virtual ~DumpProgress() = default;
  /// Step `number` of the plan begins, counted from 1; the one before is done.
  virtual void step(std::size_t number) = 0;
  /// Something that the archive will not have, and why; one line each.
  virtual void missing(std::string_view what, std::string_view why) = 0;
  /// It is done: the archive lies at the path. Later calls change nothing.
  virtual void done(const std::string& archivePath) = 0;
  /// It is over without an archive.
  virtual void failed(std::string_view reason) = 0;
};

/// A collection whose agent ended before it did.
struct CutOffDump {
  struct Step {
    std::string name;
    bool began = false;
  };
  std::string service;
  std::string directory;  ///< that was being filled
  std::vector<Step> steps;
};

/// The host's place for such records. Any thread.
class DumpProgressRecords {
 public:
  virtual ~DumpProgressRecords() = default;
  /// Never empty. A record that goes without done() or failed() reads as cut off.
  [[nodiscard]] virtual std::shared_ptr<DumpProgress> begin(DumpPlan plan) = 0;
  /// Those of former agents that have no end, the oldest first.
  [[nodiscard]] virtual std::vector<CutOffDump> cutOff() = 0;
};

}  // namespace zal
