#include "platform/linux/log/file_log_facility.h"

#include <unistd.h>

#include <algorithm>
#include <exception>
#include <utility>

#include "platform/linux/log/log_set_name.h"
#include "platform/linux/log/record_text.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

/// One write of this size costs the kernel little more per byte than any larger one.
constexpr std::size_t kFlushSize = 256U << 10U;
/// A buffer that one huge record blew up is not kept.
constexpr std::size_t kLargestSpareBuffer = 1U << 20U;
/// While the disk refuses, the next attempt when nothing else makes one.
constexpr auto kRetryDelay = 1s;
/// A file that somebody takes away is as good as taken away this much later; looking at each write
/// would cost the writer of a single record more than the write.
constexpr auto kLookInterval = 1s;
/// Files that fill faster than that are compressed a little later, together: of a flood only the
/// newest nine are worth it.
constexpr auto kFloodInterval = 2s;
constexpr auto kFloodDelay = 500ms;
/// Sets beyond the limit are only kept while the disk refuses their records, and only so many.
constexpr std::size_t kOutageFactor = 4;

}  // namespace

FileLogFacility::FileLogFacility(Host host, std::string userLogRoot, const LogSettings& settings)
    : _host(host),
      _root(std::move(userLogRoot)),
      _settings(settings),
      _time(host.clock),
      _processText("zalloggingagent[" + std::to_string(::getpid()) + "]"),
      _rotations(host.queues.makeSerial("com.vendel.lirra.log-rotation", QueuePriority::background)) {
  const UnfinishedRotations unfinished = findUnfinishedRotations(_root);
  _lastSequence = unfinished.highestSequence;
  for (const UnfinishedRotation& rotation : unfinished.files) _schedule(rotation, 0ns);
  _host.mainLoop.addSleepObserver([this, alive = std::weak_ptr<bool>(_alive)] {
    if (!alive.expired()) flush();
  });
}

FileLogFacility::~FileLogFacility() { flush(); }

void FileLogFacility::record(const LogRecord& record) {
  _mainThread.check("FileLogFacility");
  RotatingLogFile* file = _fileFor(record);
  if (file == nullptr) {
    _deliverMessages();
    return;
  }
  if (file->isRotationDue()) _rotate(*file);
  file->lastUse = ++_uses;
  if (file->bufferedBytes() == 0) file->swapBuffer(_spareBuffer);
  std::string& buffer = file->beginRecord();
  const std::size_t before = buffer.size();
  appendRecord(buffer, record, _time.nowText(), _processText);
  // In an outage only every so many bytes are worth an attempt.
  const bool isAttemptDue = before / kFlushSize != buffer.size() / kFlushSize;
  file->endRecord();
  _markDirty(*file);
  if (isAttemptDue && file->flush()) _keepSpareBuffer(*file);
  if (!_messages.empty()) _deliverMessages();
}

void FileLogFacility::flush() {
  _mainThread.check("FileLogFacility");
  _time.forget();
  _flushDirty();
  // What is said about a failure is itself a record, which belongs into its file as well.
  for (int round = 0; round < 3 && !_messages.empty() && !_isDelivering; ++round) {
    _deliverMessages();
    _flushDirty();
  }
  if (_dirty.empty() && openFiles() > _settings.maximumOpenFiles) _makeRoom();
  if (!_dirty.empty() && !_retry.isSet()) {
    _retry = ScopedTimer(_host.mainLoop, _host.mainLoop.callAfter(kRetryDelay, [this] {
      _retry = {};
      flush();
    }));
  }
}

std::size_t FileLogFacility::openFiles() const { return _files[0].size() + _files[1].size(); }

RotatingLogFile* FileLogFacility::_fileFor(const LogRecord& record) {
  const bool isEvent = isEventCategory(record.type, record.category);
  LastHit& last = _lastHit[isEvent ? 1 : 0];
  if (last.file != nullptr && last.type == record.type) return last.file;
  RotatingLogFile* file = nullptr;
  Files& files = _files[isEvent ? 1 : 0];
  const auto found = isLogSetName(record.type) ? files.find(record.type) : files.end();
  file = found != files.end() ? found->second.get() : _findOrMake(logSetName(record.type), isEvent);
  last.type.assign(record.type);
  last.file = file;
  return file;
}

RotatingLogFile* FileLogFacility::_findOrMake(const std::string& setName, bool isEvent) {
  Files& files = _files[isEvent ? 1 : 0];
  const auto found = files.find(setName);
  if (found != files.end()) return found->second.get();
  if (!_makeRoom()) {
    if (_refused++ == 0)
      _messages.push_back("too many log sets wait for the disk; records of more are dropped");
    return nullptr;
  }
  if (_refused > 0) {
    _messages.push_back(std::to_string(_refused) + " records of further log sets were dropped");
    _refused = 0;
  }
  auto file =
      std::make_unique<RotatingLogFile>(RotatingLogFile::Place{_root, setName, logFileName(setName, isEvent)},
                                        _settings.rotationSize, _messages);
  return files.emplace(setName, std::move(file)).first->second.get();
}

/// Gives up the files that were not used for longest until one more may be opened. A file whose
/// records the disk refuses stays, without its descriptor. Returned: whether one more is bearable.
bool FileLogFacility::_makeRoom() {
  if (openFiles() < _settings.maximumOpenFiles) return true;
  struct Candidate {
    bool isEvent;
    Files::iterator place;
  };
  std::vector<Candidate> candidates;
  for (const bool isEvent : {false, true}) {
    Files& files = _files[isEvent ? 1 : 0];
    for (auto place = files.begin(); place != files.end(); ++place) candidates.push_back({isEvent, place});
  }
  std::sort(candidates.begin(), candidates.end(), [](const Candidate& left, const Candidate& right) {
    return left.place->second->lastUse < right.place->second->lastUse;
  });
  for (const Candidate& candidate : candidates) {
    if (_evict(candidate.isEvent, candidate.place) && openFiles() < _settings.maximumOpenFiles) return true;
  }
  return openFiles() < _settings.maximumOpenFiles * kOutageFactor;
}

bool FileLogFacility::_evict(bool isEvent, Files::iterator found) {
  RotatingLogFile& file = *found->second;
  if (!file.flush() || file.isInOutage()) {
    file.close();
    return false;
  }
  std::erase(_dirty, &file);
  for (LastHit& last : _lastHit) {
    if (last.file == &file) last.file = nullptr;
  }
  _files[isEvent ? 1 : 0].erase(found);
  return true;
}

void FileLogFacility::_markDirty(RotatingLogFile& file) {
  if (file.isListedDirty || file.bufferedBytes() == 0) return;
  file.isListedDirty = true;
  _dirty.push_back(&file);
}

void FileLogFacility::_rotate(RotatingLogFile& file) {
  if (!file.flush()) return;
  std::uint64_t sequence = _lastSequence + 1;
  if (!file.rotateAway(sequence)) return;
  _lastSequence = sequence;
  const SteadyTime now = _host.clock.steadyNow();
  const bool isFlood = _lastRotation != SteadyTime{} && now - _lastRotation < kFloodInterval;
  _lastRotation = now;
  _schedule({_root + "/" + file.place().directory, file.place().fileName},
            isFlood ? std::chrono::nanoseconds(kFloodDelay) : 0ns);
}

void FileLogFacility::_schedule(const UnfinishedRotation& rotation, std::chrono::nanoseconds delay) {
  auto job = [rotation, log = &_host.log] {
    if (const std::error_code error = completeRotations(rotation)) {
      log->warning(rotation.directory + "/" + rotation.fileName +
                   ": its rotation cannot be ended: " + error.message());
    }
  };
  try {
    if (delay > 0ns) {
      _rotations->asyncAfter(delay, std::move(job));
    } else {
      _rotations->async(std::move(job));
    }
  } catch (const std::exception& exception) {
    // The file's next rotation takes it along, or the next start. The record that asked for it goes on.
    _messages.push_back(rotation.directory + "/" + rotation.fileName +
                        ": its rotation waits: " + exception.what());
  }
}

void FileLogFacility::_flushDirty() {
  if (_dirty.empty()) return;
  const SteadyTime now = _host.clock.steadyNow();
  std::erase_if(_dirty, [this, now](RotatingLogFile* file) {
    if (now - file->lastLook >= kLookInterval) {
      file->lastLook = now;
      file->leaveIfReplaced();
    }
    if (!file->flush()) return false;
    _keepSpareBuffer(*file);
    file->isListedDirty = false;
    return true;
  });
}

void FileLogFacility::_keepSpareBuffer(RotatingLogFile& file) {
  std::string own;
  file.swapBuffer(own);
  if (own.capacity() > _spareBuffer.capacity() && own.capacity() <= kLargestSpareBuffer)
    _spareBuffer.swap(own);
}

void FileLogFacility::_deliverMessages() {
  if (_isDelivering) return;
  _isDelivering = true;
  for (const std::string& message : std::exchange(_messages, {})) _host.log.warning(message);
  _isDelivering = false;
}

}  // namespace zal
