#include "session/line_runs.h"

#include <algorithm>
#include <cstring>

#include <queue>
#include <utility>

#include "session/line_file.h"

namespace zal {

namespace {

using LineEntry = ZalPair<std::string_view, double>;
constexpr std::size_t kRunHeader = sizeof(double) + sizeof(std::uint32_t);

std::vector<LineEntry> inOrder(const LinePart& part, std::size_t begin, std::size_t end) {
  const auto at = [&part](std::size_t line) {
    return part.lines.begin() + static_cast<std::vector<LineEntry>::difference_type>(line);
  };
  // The latest first, and what has the same time stays so.
  std::vector<LineEntry> lines(std::make_reverse_iterator(at(end)), std::make_reverse_iterator(at(begin)));
  std::stable_sort(lines.begin(), lines.end(),
                   [](const LineEntry& a, const LineEntry& b) { return a.second < b.second; });
  return lines;
}

bool isPlain(const LinePart& part) { return !part.texts || part.texts->isAscii(); }

class SpilledRunReader final : public LineRunReader {
 public:
  SpilledRunReader(SpillFile& file, const LineRun& run, std::size_t bufferSize)
      : _file(file), _next(run.offset), _unread(run.size), _bufferSize(bufferSize) {}

  bool next() override {
    _at += _length;
    _length = 0;
    if (!_has(kRunHeader)) return false;
    std::uint32_t length = 0;
    std::memcpy(&_time, _buffer.data() + _at, sizeof _time);
    std::memcpy(&length, _buffer.data() + _at + sizeof _time, sizeof length);
    _at += kRunHeader;
    if (!_has(length)) {
      _failed = true;
      return false;
    }
    _length = length;
    return true;
  }
  [[nodiscard]] double time() const override { return _time; }
  [[nodiscard]] std::string_view bytes() const override {
    return std::string_view(_buffer).substr(_at, _length);
  }
  [[nodiscard]] bool failed() const override { return _failed; }

 private:
  /// Has so many bytes in the buffer from here on, if there are so many.
  bool _has(std::size_t wanted) {
    const std::size_t left = _buffer.size() - _at;
    if (left >= wanted) return true;
    if (_unread < wanted - left) return false;
    _buffer.erase(0, std::exchange(_at, 0));
    const auto more =
        static_cast<std::size_t>(std::min<std::uint64_t>(_unread, std::max(_bufferSize, wanted) - left));
    _buffer.resize(left + more);
    if (!_file.read(_next, _buffer.data() + left, more)) {
      _failed = true;
      _buffer.resize(left);
      return false;
    }
    _next += more;
    _unread -= more;
    return true;
  }

  SpillFile& _file;
  std::uint64_t _next, _unread;
  const std::size_t _bufferSize;
  std::string _buffer;
  std::size_t _at = 0, _length = 0;
  double _time = 0;
  bool _failed = false;
};

class HeldRunReader final : public LineRunReader {
 public:
  HeldRunReader(const LinePart& part, std::size_t begin)
      : _lines(inOrder(part, begin, part.lines.size())), _isPlain(isPlain(part)) {}

  bool next() override { return _next < _lines.size() && ++_next > 0; }
  [[nodiscard]] double time() const override { return _lines[_next - 1].second; }
  [[nodiscard]] std::string_view bytes() const override {
    return writtenPart(_lines[_next - 1].first, _isPlain);
  }
  [[nodiscard]] bool failed() const override { return false; }

 private:
  const std::vector<LineEntry> _lines;
  const bool _isPlain;
  std::size_t _next = 0;
};

}  // namespace

bool appendRun(const LinePart& part, std::size_t begin, std::size_t end, SpillFile& file,
               std::string& buffer) {
  buffer.clear();
  for (const auto& [text, time] : inOrder(part, begin, end)) {
    const std::string_view bytes = writtenPart(text, isPlain(part));
    const auto length = static_cast<std::uint32_t>(bytes.size());
    char header[kRunHeader];
    std::memcpy(header, &time, sizeof time);
    std::memcpy(header + sizeof time, &length, sizeof length);
    buffer.append(header, sizeof header).append(bytes);
  }
  return file.append(buffer);
}

std::unique_ptr<LineRunReader> readerOf(SpillFile& file, const LineRun& run, std::size_t bufferSize) {
  return std::make_unique<SpilledRunReader>(file, run, bufferSize);
}

std::unique_ptr<LineRunReader> readerOf(const LinePart& part, std::size_t begin) {
  return std::make_unique<HeldRunReader>(part, begin);
}

bool mergeRuns(const std::vector<std::unique_ptr<LineRunReader>>& runs,
               const std::function<void(std::string_view bytes)>& take) {
  using Candidate = ZalPair<double, std::size_t>;  // time of the run's next line, and the run
  const auto comesLater = [](const Candidate& a, const Candidate& b) {
    return a.first > b.first || (a.first == b.first && a.second < b.second);
  };
  std::priority_queue<Candidate, std::vector<Candidate>, decltype(comesLater)> candidates(comesLater);
  const auto advance = [&](std::size_t run) {
    if (runs[run]->next()) candidates.push({runs[run]->time(), run});
  };
  for (std::size_t run = 0; run < runs.size(); ++run) advance(run);
  while (!candidates.empty()) {
    const std::size_t run = candidates.top().second;
    candidates.pop();
    take(runs[run]->bytes());
    advance(run);
  }
  return std::none_of(runs.begin(), runs.end(), [](const auto& run) { return run->failed(); });
}

}  // namespace zal
