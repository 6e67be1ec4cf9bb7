#include "session/spilled_lines.h"

#include <algorithm>
#include <utility>

#include "session/line_file.h"

namespace zal {

namespace {
// Of one run. Small enough that sorting and freeing follow each other closely, and that there are few runs.
constexpr std::uint64_t kRunSize = 8U << 20U;
// What all runs together are read through, and the least for one of them.
constexpr std::size_t kReadMemory = 16U << 20U;
constexpr std::size_t kLeastReadMemory = 4096;
constexpr std::size_t kMostReadMemory = 256U << 10U;
}  // namespace

SpilledLines::SpilledLines(SpillFiles& files, AgentLog& log, Freed freed)
    : _files(files), _log(log), _freed(std::move(freed)) {}

void SpilledLines::add(LinePart part) {
  const std::scoped_lock lock(_adding);
  _count += part.lines.size();
  _waiting.push_back({std::move(part)});
}

std::size_t SpilledLines::count() const {
  const std::scoped_lock lock(_adding);
  return _count;
}

void SpilledLines::settle() {
  const std::scoped_lock working(_working);
  for (;;) {
    Waiting* first = nullptr;
    {
      const std::scoped_lock lock(_adding);
      if (_waiting.empty()) break;
      first = &_waiting.front();
    }
    while (first->done < first->part.lines.size()) {
      if (!_settleSome(*first)) return;
    }
    const std::scoped_lock lock(_adding);
    _waiting.pop_front();
  }
  std::string().swap(_buffer);
}

bool SpilledLines::_settleSome(Waiting& waiting) {
  if (!_file) _file = _files.make();
  const auto& lines = waiting.part.lines;
  std::uint64_t size = 0;
  std::size_t end = waiting.done;
  while (end < lines.size() && size < kRunSize) size += memoryOfLine(lines[end++].first);
  const std::uint64_t offset = _file->size();
  if (!appendRun(waiting.part, waiting.done, end, *_file, _buffer)) {
    if (!std::exchange(_saidRefused, true)) {
      _log.warning("Lines of a session stay in memory, over the limit: " + _file->trouble());
    }
    return false;
  }
  _runs.push_back({offset, _file->size() - offset});
  waiting.done = end;
  if (end < lines.size() && waiting.part.texts) waiting.part.texts->releaseBefore(lines[end].first);
  _freed(size);
  return true;
}

std::vector<std::unique_ptr<LineRunReader>> SpilledLines::_readers(const LinePart& rest) {
  std::vector<std::unique_ptr<LineRunReader>> readers;
  const std::size_t buffer =
      std::clamp(kReadMemory / std::max<std::size_t>(_runs.size(), 1), kLeastReadMemory, kMostReadMemory);
  for (const LineRun& run : _runs) readers.push_back(readerOf(*_file, run, buffer));
  for (const Waiting& waiting : _waiting) readers.push_back(readerOf(waiting.part, waiting.done));
  readers.push_back(readerOf(rest, 0));
  return readers;
}

bool SpilledLines::write(const LogLines& header, const LinePart& rest, FilePlacement& files,
                         const std::string& path) {
  const std::scoped_lock lock(_working, _adding);
  BufferedFile file(files, path);
  const bool isPlain = !header.texts || header.texts->isAscii();
  for (const std::string_view line : header.lines) file.append(writtenPart(line, isPlain));
  const bool isRead = mergeRuns(_readers(rest), [&file](std::string_view bytes) { file.append(bytes); });
  if (!isRead) _log.warning("Lines for " + path + " were lost: " + _file->trouble());
  return closeOrWarn(file, path, _log) && isRead;
}

}  // namespace zal
