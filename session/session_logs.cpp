#include "session/session_logs.h"

#include <algorithm>
#include <utility>

#include "platform/run_loop.h"
#include "session/line_file.h"

namespace zal {

namespace {

/// What the main thread may write in one go.
constexpr std::uint64_t kLargestAtOnce = 4U << 20U;
/// Once the beginning of a session is on the disk, the rest follows in such pieces.
constexpr std::uint64_t kNextPart = 16U << 20U;

void addHeader(_ZalLoggingAgentSessionSortedLogList& list, const HeaderLines& header) {
  for (const std::string& line : header.timedLines()) list.prependLog(line);
}
void addHeader(QualityLogList& list, const HeaderLines& header) {
  for (const std::string& line : header.qualityLines()) list.insertAtFront(line);
}
LogLines headerOf(const _ZalLoggingAgentSessionSortedLogList& list) { return list.prependedLines(); }
LogLines headerOf(const QualityLogList& list) { return list.frontLines(); }
LogLines allOf(const _ZalLoggingAgentSessionSortedLogList& list) { return list.copySortedLogList(); }
LogLines allOf(const QualityLogList& list) { return list.copy(); }

}  // namespace

SessionLogs::SessionLogs(SessionServices& services) : _services(services) {
  if (_services.memory == nullptr) return;
  _hold = _services.memory->makeHold();
  _services.memory->addUser(*this);
}

SessionLogs::~SessionLogs() {
  if (_services.memory != nullptr) _services.memory->removeUser(*this);
  if (_leaving) _hold.absorb(*_leaving);  // given back here, whoever has the other one still
}

void SessionLogs::addCheckpoint(std::string_view line, double time) {
  _simple.lines.addLog(line, time);
  _verbose.lines.addLog(line, time);
  _note(2 * memoryOfLine(line));
}

void SessionLogs::addDescription(std::string_view line, double time) {
  _verbose.lines.addLog(line, time);
  _note(memoryOfLine(line));
}

void SessionLogs::addQuality(std::string_view line) {
  _quality.lines.append(line);
  _note(memoryOfLine(line));
}

bool SessionLogs::hasTimedLines() const { return _simple.count() > 0 || _verbose.count() > 0; }

bool SessionLogs::anyHas(std::size_t lines) const {
  return _simple.count() >= lines || _verbose.count() >= lines || _quality.count() >= lines;
}

bool SessionLogs::areLarge() const { return _leaving || _bytes > kLargestAtOnce; }

void SessionLogs::_note(std::uint64_t bytes) {
  _bytes += bytes;
  MemoryLedger* const memory = _services.memory;
  if (memory == nullptr) return;
  _hold.add(bytes);
  if (_leaving && _bytes > kNextPart) giveUp();
  memory->relieve(*this);
}

std::uint64_t SessionLogs::canGiveUp(const MemoryAccount* account) const {
  return account == nullptr ? _bytes : _hold.bytesOf(*account);
}

void SessionLogs::giveUp() {
  if (_services.spillFiles == nullptr || _bytes == 0) return;
  if (!_leaving) _leaving = std::make_shared<MemoryHold>();
  _leaving->absorb(_hold);
  _bytes = 0;
  _spill(_simple);
  _spill(_verbose);
  _spill(_quality);
}

template <class List>
void SessionLogs::_spill(Log<List>& log) {
  LinePart part = log.lines.takeLines();
  if (part.lines.empty()) return;
  if (!log.spilled) {
    log.spilled = std::make_shared<SpilledLines>(*_services.spillFiles, _services.agentLog, _freed());
  }
  log.spilled->add(std::move(part));
  if (_services.queues == nullptr) return log.spilled->settle();
  if (!_queue) _queue = _services.queues->makeSerial("session.lines");
  _queue->async([spilled = log.spilled] { spilled->settle(); });
}

SpilledLines::Freed SessionLogs::_freed() {
  const std::weak_ptr<MemoryHold> leaving = _leaving;
  const auto release = [leaving](std::uint64_t bytes) {
    if (const auto hold = leaving.lock()) hold->release(bytes);
  };
  if (_services.queues == nullptr) return release;
  return [release, &loop = _services.mainLoop](std::uint64_t bytes) {
    loop.post([release, bytes] { release(bytes); });
  };
}

template <class List>
SessionLogWriting::File SessionLogs::_fileOf(Log<List>& log, std::string path,
                                             std::shared_ptr<const HeaderLines> header) {
  // Shared, as a function is copied.
  const auto taken = std::make_shared<Log<List>>(std::exchange(log, {}));
  return [taken, path = std::move(path), header = std::move(header), &files = _services.files,
          &agentLog = _services.agentLog] {
    addHeader(taken->lines, *header);
    if (!taken->spilled) {
      const LogLines lines = allOf(taken->lines);
      taken->lines.removeAllObjects();
      return writeStrings(lines, files, path, agentLog);
    }
    const LinePart rest = taken->lines.takeLines();
    return taken->spilled->write(headerOf(taken->lines), rest, files, path);
  };
}

SessionLogs::Taken SessionLogs::take(const std::string& directory, const std::string& fileEnding,
                                     const std::shared_ptr<HeaderLines>& header) {
  Taken taken;
  taken.hold = std::make_shared<MemoryHold>();
  taken.hold->absorb(_hold);
  if (_leaving) taken.hold->absorb(*std::exchange(_leaving, nullptr));
  _bytes = 0;
  std::vector<SessionLogWriting::File> files;
  files.emplace_back([header] {
    header->complete();
    return true;
  });
  files.push_back(_fileOf(_simple, directory + "/" + fileEnding, header));
  files.push_back(_fileOf(_verbose, directory + "/Verbose " + fileEnding, header));
  files.push_back(_fileOf(_quality, directory + "/Quality " + fileEnding, header));
  taken.writing = std::make_shared<SessionLogWriting>(std::move(files), _services.agentLog);
  return taken;
}

}  // namespace zal
