#include "platform/linux/tessel/syslog_source.h"

#include <sys/stat.h>

#include <cerrno>
#include <system_error>

#include "platform/linux/tessel/file_watch.h"
#include "platform/linux/tessel/line_output.h"
#include "platform/linux/tessel/syslog_line.h"

namespace zal::tessel {
namespace {

/// A file last written before that moment holds nothing from after it.
bool mayHoldSince(const std::string& path, std::optional<WallTime> since) {
  struct stat status {};
  if (::stat(path.c_str(), &status) != 0) return false;
  return !since || std::chrono::seconds(status.st_mtim.tv_sec + 1) >= since->time_since_epoch();
}

}  // namespace

std::unique_ptr<SyslogSource> SyslogSource::open(const std::vector<std::string>& paths, const Clock& clock,
                                                 std::string& trouble) {
  for (const std::string& path : paths) {
    SyslogFile file(path);
    if (file.isOpen()) return std::unique_ptr<SyslogSource>(new SyslogSource(path, std::move(file), clock));
    trouble += (trouble.empty() ? "" : "; ") + path + ": " + std::generic_category().message(errno);
  }
  return nullptr;
}

std::optional<std::string> SyslogSource::print(std::optional<WallTime> since, LineOutput& output) {
  const WallTime now = _clock.wallNow();
  bool isWanted = !since;
  const auto printLine = [&](std::string_view line) {
    // A line without a time belongs to the one before.
    if (since) {
      if (const auto time = syslogLineTime(line, now, _clock)) isWanted = *time >= *since;
    }
    return !isWanted || output.write(printedSyslogLine(line, now, _clock));
  };
  const auto printFile = [&](SyslogFile& file) {
    if (!file.readLines(printLine)) return false;
    const std::string rest = file.takeRest();
    return rest.empty() || printLine(rest);
  };
  const std::string previous = _path + ".1";
  if (mayHoldSince(previous, since)) {
    SyslogFile file(previous);
    if (file.isOpen() && !printFile(file)) return output.trouble();
  }
  return printFile(_file) ? std::nullopt : std::optional(output.trouble());
}

std::string SyslogSource::follow(LineOutput& output) {
  _file.skipToEnd();
  FileWatch watch(_path);
  while (_catchUp(watch, output)) watch.wait();
  return output.trouble();
}

bool SyslogSource::_catchUp(FileWatch& watch, LineOutput& output) {
  const auto printLine = [&](std::string_view line) { return _printLine(line, output); };
  for (;;) {
    if (_previous && !_previous->readLines(printLine)) return false;
    if (!_file.readLines(printLine)) return false;
    if (_file.isAt(_path).value_or(true)) return true;
    SyslogFile next(_path);
    if (!next.isOpen()) return true;
    // Watched before it is read, or what comes in between would wait for the next change.
    watch.addFile();
    if (_previous) {
      const std::string rest = _previous->takeRest();
      if (!rest.empty() && !printLine(rest)) return false;
    }
    _previous = std::move(_file);
    _file = std::move(next);
  }
}

bool SyslogSource::_printLine(std::string_view line, LineOutput& output) {
  return output.write(printedSyslogLine(line, _clock.wallNow(), _clock));
}

}  // namespace zal::tessel
