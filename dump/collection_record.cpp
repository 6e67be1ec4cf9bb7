#include "dump/collection_record.h"

#include <algorithm>
#include <utility>

namespace zal {
namespace {

using Account = CollectionAccount;

constexpr int kSignalBits = 0x7F;
constexpr int kExitShift = 8;

struct Tally {
  std::size_t taken = 0, absent = 0, broken = 0;
};

std::vector<Tally> tallySteps(const Account& account) {
  std::vector<Tally> tallies(account.steps.size());
  const auto count = [&](std::size_t step, PartState state, bool mayLack) {
    if (step >= tallies.size()) return;
    Tally& tally = tallies[step];
    if (state == PartState::done) {
      ++tally.taken;
    } else if (state == PartState::missing && mayLack) {
      ++tally.absent;
    } else {
      ++tally.broken;
    }
  };
  // Sources are often alternatives: one that is absent takes nothing from the others.
  for (const Account::Source& source : account.sources) count(source.step, source.state, true);
  for (const Account::Command& command : account.commands) count(command.step, command.state, false);
  return tallies;
}

}  // namespace

void settleSteps(CollectionAccount& account) {
  const auto tallies = tallySteps(account);
  for (std::size_t i = 0; i < tallies.size(); ++i) {
    Account::Step& step = account.steps[i];
    if (step.state != PartState::done) continue;
    if (tallies[i].broken > 0) {
      step.state = PartState::partial;
    } else if (tallies[i].taken == 0 && tallies[i].absent > 0) {
      step.state = PartState::missing;
      step.why.emplace_back("none of its sources is there");
    }
  }
}

CollectionRecord::CollectionRecord(Plan plan, const Clock& clock, std::shared_ptr<DumpProgress> progress)
    : _clock(clock), _progress(std::move(progress)) {
  _account.service = std::move(plan.service);
  _account.directory = std::move(plan.directory);
  _account.flags = plan.flags;
  _account.isFinishedLater = plan.isFinishedLater;
  _account.began = clock.wallNow();
  for (PlannedStep& planned : plan.steps) {
    if (planned.isWanted) _wanted.push_back(_account.steps.size());
    Account::Step step;
    step.name = std::move(planned.name);
    if (!planned.isWanted) {
      step.state = planned.unwanted;
      if (!planned.whyNot.empty()) step.why = {std::move(planned.whyNot)};
    }
    _account.steps.push_back(std::move(step));
  }
}

void CollectionRecord::step(std::size_t number) {
  _progress->step(number);
  const std::scoped_lock lock(_mutex);
  if (number == 0 || number > _wanted.size()) return;
  const SteadyTime now = _clock.steadyNow();
  Account::Step& before = _account.steps[_current];
  if (before.state == PartState::running) before.state = PartState::done;
  if (before.began) {
    before.duration = std::chrono::duration_cast<std::chrono::milliseconds>(now - _currentBegan);
  }
  _current = _wanted[number - 1];
  _currentBegan = now;
  _account.steps[_current].state = PartState::running;
  _account.steps[_current].began = _clock.wallNow();
}

void CollectionRecord::stepGives(PartState nothing, std::string_view why) {
  std::string name;
  {
    const std::scoped_lock lock(_mutex);
    if (_account.steps.empty()) return;
    Account::Step& step = _account.steps[_current];
    step.state = nothing;
    step.why.emplace_back(why);
    name = step.name;
  }
  _progress->missing(name, why);
}

void CollectionRecord::keepForThisStep(std::string directory) {
  const std::scoped_lock lock(_mutex);
  _kept.push_back({std::move(directory), _current});
}

void CollectionRecord::output(const std::string& file, PartState state, const std::string& why) {
  _progress->missing(file, why);
  const std::scoped_lock lock(_mutex);
  bool isKnown = false;
  for (Account::Command& command : _account.commands) {
    if (command.file != file) continue;
    isKnown = true;
    command.state = state;
    command.why = why;
  }
  if (isKnown) return;
  // A command that was started before the collection, or by somebody else.
  Account::Command command;
  command.file = file;
  command.step = _account.steps.size();
  command.state = state;
  command.why = why;
  _account.commands.push_back(std::move(command));
}

void CollectionRecord::done(const std::string& archivePath) { _progress->done(archivePath); }
void CollectionRecord::failed(std::string_view reason) { _progress->failed(reason); }

std::size_t CollectionRecord::_stepOf(const std::string& path) const {
  for (const Kept& kept : _kept) {
    if (path.starts_with(kept.directory + "/") || path == kept.directory) return kept.step;
  }
  return _current;
}

std::string CollectionRecord::_below(const std::string& path) const {
  const std::string& top = _account.directory;
  return path.size() > top.size() && path.starts_with(top) ? path.substr(top.size() + 1) : "";
}

void CollectionRecord::source(const std::string& source, const std::string& directory, SourceOutcome outcome,
                              const std::string& why) {
  const std::scoped_lock lock(_mutex);
  if (_account.sources.size() >= kMostRows) {
    ++_account.rowsLeftOut;
    return;
  }
  const PartState state = outcome == SourceOutcome::taken    ? PartState::done
                          : outcome == SourceOutcome::absent ? PartState::missing
                                                             : PartState::failed;
  _account.sources.push_back({source, _below(directory), _stepOf(directory), state, why});
}

void CollectionRecord::command(std::string_view commandLine, const std::string& outputFile,
                               std::optional<int> waitStatus) {
  const std::scoped_lock lock(_mutex);
  if (_account.commands.size() >= kMostRows) {
    ++_account.rowsLeftOut;
    return;
  }
  Account::Command command;
  command.line = commandLine;
  command.file = _below(outputFile);
  command.step = _stepOf(outputFile);
  command.began = _clock.wallNow();
  if (waitStatus && *waitStatus != 0) {
    const bool exited = *waitStatus > 0 && (*waitStatus & kSignalBits) == 0;
    if (exited) command.exitStatus = *waitStatus >> kExitShift;
    command.state = PartState::failed;
    command.why = exited            ? "it ended with status " + std::to_string(*command.exitStatus)
                  : *waitStatus < 0 ? "it could not be started"
                                    : "signal " + std::to_string(*waitStatus & kSignalBits) + " ended it";
  } else if (waitStatus) {
    command.exitStatus = 0;
  }
  _account.commands.push_back(std::move(command));
}

CollectionAccount CollectionRecord::account() const {
  CollectionAccount account;
  {
    const std::scoped_lock lock(_mutex);
    account = _account;
    if (account.steps.empty()) return account;
    Account::Step& last = account.steps[_current];
    if (last.state == PartState::running) last.state = PartState::done;
    if (last.began) {
      last.duration =
          std::chrono::duration_cast<std::chrono::milliseconds>(_clock.steadyNow() - _currentBegan);
    }
  }
  settleSteps(account);
  return account;
}

}  // namespace zal
