#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/tessel/line_splitter.h"

namespace zal::tessel {

/// One open file of lines that others append to; it stays the same file when it is renamed.
class SyslogFile {
 public:
  /// False: there is no more use in going on.
  using OnLine = std::function<bool(std::string_view line)>;

  /// Not open when the file cannot be read; errno then says why.
  explicit SyslogFile(const std::string& path);
  [[nodiscard]] bool isOpen() const { return _file.isOpen(); }
  /// Whether this is the file that the path names now; nothing when it names none.
  [[nodiscard]] std::optional<bool> isAt(const std::string& path) const;
  /// From here on only what is written later; a line that somebody is in the middle of is left out.
  void skipToEnd();
  /// All whole lines up to the end as it is now. A file that became shorter is read from its start.
  /// False when `onLine` was.
  bool readLines(const OnLine& onLine);
  /// The last line, where its end is missing.
  [[nodiscard]] std::string takeRest() { return _lines.takeRest(); }

 private:
  Descriptor _file;
  LineSplitter _lines;
};

}  // namespace zal::tessel
