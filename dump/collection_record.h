#pragma once

#include <chrono>
#include <cstddef>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "collectors/gathering_witness.h"
#include "dump/collection_flags.h"
#include "platform/clock.h"
#include "platform/dump_progress.h"

namespace zal {

/// How a part of a collection ended, or that it did not.
enum class PartState {
  notRun,   ///< planned, and its turn never came
  running,  ///< not over when the archive was made
  done,
  partial,
  missing,  ///< what it takes from is not there
  failed,
  skipped,  ///< not asked for
};

/// A step that a collection of this kind may have.
struct PlannedStep {
  std::string name;
  bool isWanted = true;
  std::string whyNot;                       ///< when it is not wanted
  PartState unwanted = PartState::skipped;  ///< what it counts as then
};

/// What is known of a collection, as plain values.
struct CollectionAccount {
  struct Step {
    std::string name;
    PartState state = PartState::notRun;
    std::optional<WallTime> began;
    std::chrono::milliseconds duration{0};
    std::vector<std::string> why;
  };
  struct Source {
    std::string path;
    std::string directory;  ///< below the destination, where it goes
    std::size_t step = 0;   ///< index of its step
    PartState state = PartState::done;
    std::string why;
  };
  struct Command {
    std::string line;
    std::string file;      ///< below the destination, its output
    std::size_t step = 0;  ///< index of its step
    WallTime began{};
    PartState state = PartState::done;
    std::optional<int> exitStatus;  ///< nothing: nobody waited for it
    std::string why;
  };
  std::string service;
  std::string directory;
  CollectionFlags flags = 0;
  WallTime began{};
  std::vector<Step> steps;  ///< all that are planned, the skipped ones too, in order
  std::vector<Source> sources;
  std::vector<Command> commands;
  bool isFinishedLater = false;  ///< by another agent than the one that began
  std::size_t rowsLeftOut = 0;   ///< sources and commands for which there was no room
};

/// The account of one collection while it is being made; what watchers need to hear goes on to the
/// progress record. Any thread.
class CollectionRecord : public GatheringWitness {
 public:
  /// Of sources and commands each; beyond it they are only counted.
  static constexpr std::size_t kMostRows = 10'000;

  struct Plan {
    std::string service, directory;
    CollectionFlags flags = 0;
    std::vector<PlannedStep> steps;
    bool isFinishedLater = false;
  };
  /// The clock outlives it. The progress record was begun with the plan's wanted steps.
  CollectionRecord(Plan plan, const Clock& clock, std::shared_ptr<DumpProgress> progress);

  /// Wanted step `number` begins, counted from 1; the one before is over.
  void step(std::size_t number);
  /// The step that runs gives nothing: missing or failed.
  void stepGives(PartState nothing, std::string_view why);
  /// What goes below the directory from now on belongs to the step that runs, whenever it comes.
  void keepForThisStep(std::string directory);
  /// An output, below the destination, that is not whole: running or missing.
  void output(const std::string& file, PartState state, const std::string& why);
  void done(const std::string& archivePath);
  void failed(std::string_view reason);

  void source(const std::string& source, const std::string& directory, SourceOutcome outcome,
              const std::string& why) override;
  void command(std::string_view commandLine, const std::string& outputFile,
               std::optional<int> waitStatus) override;

  /// As it stands; the step that runs counts as over.
  [[nodiscard]] CollectionAccount account() const;

 private:
  [[nodiscard]] std::size_t _stepOf(const std::string& path) const;
  [[nodiscard]] std::string _below(const std::string& path) const;

  const Clock& _clock;
  const std::shared_ptr<DumpProgress> _progress;
  mutable std::mutex _mutex;
  // Guarded by _mutex from here on.
  CollectionAccount _account;
  std::vector<std::size_t> _wanted;  // indices of the wanted steps
  std::size_t _current = 0;
  SteadyTime _currentBegan{};
  struct Kept {
    std::string directory;
    std::size_t step;
  };
  std::vector<Kept> _kept;
};

/// The step's state from what belongs to it: nothing there is missing, a part is partial.
void settleSteps(CollectionAccount& account);

}  // namespace zal
