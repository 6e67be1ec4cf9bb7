#include "platform/linux/stackshot/survey.h"

#include <unistd.h>

#include <algorithm>
#include <ctime>
#include <string>

#include "platform/linux/stackshot/process_files.h"
#include "platform/linux/stackshot/stack_reader.h"

namespace zal::stackshot {
namespace {

constexpr std::chrono::milliseconds kMoment{2};
constexpr int kMoments = 10;
/// Our parent allows us to trace it when it has us: that may be a moment after our begin.
constexpr int kParentMoments = 50;

void pause() {
  const timespec moment{.tv_sec = 0, .tv_nsec = std::chrono::nanoseconds(kMoment).count()};
  ::nanosleep(&moment, nullptr);
}

/// A disk answers soon; what sleeps so for longer may never stop.
bool sleepsUninterruptibly(pid_t process, const ThreadRecord& thread) {
  char state = thread.state;
  for (int moment = 0; state == 'D' && moment < kMoments; ++moment) {
    pause();
    state = stateOf(process, thread.id);
  }
  return state == 'D';
}

bool hasEnded(char state) { return state == 'Z' || state == 'X' || state == '?'; }

std::string whyNotHeld(const std::error_code& error, pid_t process, pid_t thread) {
  if (error == std::errc::timed_out) return "did not stop in time";
  if (error == std::errc::no_such_process) return "ended meanwhile";
  if (error == std::errc::operation_not_permitted && tracerOf(process, thread) != 0)
    return "traced by another process";
  return error.message();
}

/// What the kernel tells about a thread that has no other stack here.
void readKernelSide(pid_t process, ThreadRecord& thread) {
  thread.kernelFrames = kernelFramesOf(process, thread.id);
}

const ThreadRecord* firstLiving(const ProcessRecord& process) {
  const auto found = std::find_if(process.threads.begin(), process.threads.end(),
                                  [](const ThreadRecord& thread) { return !hasEnded(thread.state); });
  return found == process.threads.end() ? nullptr : &*found;
}

}  // namespace

std::optional<ProcessRecord> Survey::process(pid_t id) {
  auto process = readProcess(id);
  if (!process) return std::nullopt;
  const std::vector<pid_t> threads = threadsOf(id);
  process->threadCount = threads.size();
  for (const pid_t thread : threads) {
    if (process->threads.size() == _limits.threads) break;
    if (auto record = readThread(id, thread)) process->threads.push_back(std::move(*record));
  }
  if (process->kind == ProcessKind::kernel) {
    for (ThreadRecord& thread : process->threads) readKernelSide(id, thread);
  } else if (firstLiving(*process) == nullptr) {
    process->kind = ProcessKind::ended;
  } else {
    _readStacks(*process);
  }
  return process;
}

void Survey::_readStacks(ProcessRecord& process) {
  const auto forAll = [&process](const std::string& trouble) {
    for (ThreadRecord& thread : process.threads) {
      thread.trouble = trouble;
      readKernelSide(process.id, thread);
    }
  };
  if (process.id == ::getpid()) return forAll("the program that writes this");
  if (_timeLeft.isOver()) return forAll(_timeLeft.whyOver());
  StackReader reader(process.id, firstLiving(process)->id, _symbols);
  if (!reader.trouble().empty()) return forAll(reader.trouble());
  const Tracer::TimePoint end = _timeLeft.atMost(_limits.process);
  for (ThreadRecord& thread : process.threads) _readStack(reader, process, thread, end);
  _tracer.letGo();
  for (ThreadRecord& thread : process.threads) {
    for (Frame& frame : thread.frames) reader.name(frame);
  }
}

void Survey::_readStack(StackReader& reader, const ProcessRecord& process, ThreadRecord& thread,
                        Tracer::TimePoint end) {
  if (_timeLeft.isOver()) {
    thread.trouble = _timeLeft.whyOver();
  } else if (std::chrono::steady_clock::now() > end) {
    thread.trouble = "time limit of its process";
  } else if (hasEnded(thread.state)) {
    thread.trouble = "ended";
  } else if (sleepsUninterruptibly(process.id, thread)) {
    thread.trouble = "sleeps uninterruptibly";
  } else if (const auto error = _hold(process, thread.id)) {
    thread.trouble = whyNotHeld(error, process.id, thread.id);
  } else {
    const auto begin = std::chrono::steady_clock::now();
    auto found = reader.frames(thread.id, _limits.frames, end);
    _tracer.letGo();
    _longestHold = std::max<std::chrono::nanoseconds>(_longestHold, std::chrono::steady_clock::now() - begin);
    thread.frames = std::move(found.frames);
    thread.trouble = std::move(found.trouble);
    return;
  }
  readKernelSide(process.id, thread);
}

std::error_code Survey::_hold(const ProcessRecord& process, pid_t thread) {
  const int tries = process.id == ::getppid() ? kParentMoments : 1;
  for (int moment = 1;; ++moment) {
    const auto error = _tracer.hold(thread, _timeLeft.atMost(_limits.toStop));
    if (error != std::errc::operation_not_permitted || moment >= tries || _timeLeft.isOver()) return error;
    pause();
  }
}

}  // namespace zal::stackshot
