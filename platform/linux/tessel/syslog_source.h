#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "platform/linux/tessel/log_source.h"
#include "platform/linux/tessel/syslog_file.h"

namespace zal::tessel {

class FileWatch;

/// The file that the host's syslog daemon writes, and its predecessor FILE.1 when that is no archive.
class SyslogSource final : public LogSource {
 public:
  /// The first of the paths that can be read. None when there is none, and then `trouble` says why.
  [[nodiscard]] static std::unique_ptr<SyslogSource> open(const std::vector<std::string>& paths,
                                                          const Clock& clock, std::string& trouble);
  [[nodiscard]] std::optional<std::string> print(std::optional<WallTime> since, LineOutput& output) override;
  /// Goes over to the new file when the daemon does: the old one is read on until then.
  [[nodiscard]] std::string follow(LineOutput& output) override;

 private:
  SyslogSource(std::string path, SyslogFile file, const Clock& clock)
      : _path(std::move(path)), _clock(clock), _file(std::move(file)) {}
  bool _printLine(std::string_view line, LineOutput& output);
  /// False when the output is broken.
  bool _catchUp(FileWatch& watch, LineOutput& output);

  std::string _path;
  const Clock& _clock;
  SyslogFile _file;
  std::optional<SyslogFile> _previous;  ///< what the path named before; some daemons still write to it
};

}  // namespace zal::tessel
