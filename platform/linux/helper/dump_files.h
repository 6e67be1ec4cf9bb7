#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/helper/bounded_program.h"
#include "platform/linux/helper/patience.h"

namespace zal::helper {

/// The files of one dump in one directory, all names beginning with the same prefix. Each comes under
/// its name in one step, readable for its owner alone, and goes on being there whatever happens to
/// the rest of the dump. It keeps a line about every source, for the note that goes with the files.
class DumpFiles {
 public:
  /// The directory exists and is no link. It is looked for once: what takes its name later gets nothing.
  DumpFiles(std::string directory, std::string prefix);

  /// A source's text under that name (behind the prefix). A note about it is optional.
  void write(const std::string& name, std::string_view content, const std::string& remark = {});
  /// What a program said: its output when there is any, and whether and why it is not all.
  /// `withErrors`: the file holds what it said on its standard error too, and the trouble.
  void writeOutcome(const std::string& name, const std::string& source, const ProgramOutcome& outcome,
                    bool withErrors);
  /// The file's content, at most that many bytes, in portions. Returned: whether anything was copied.
  bool copy(const std::string& name, const std::string& source, std::uint64_t mostBytes, Patience& patience);
  /// A source that gave nothing, and why.
  void missing(const std::string& source, const std::string& reason);

  /// Where the file of that name is, or would be.
  [[nodiscard]] std::string pathOf(const std::string& name) const {
    return _directory + "/" + _prefix + name;
  }
  /// One line about each source, in the order they came.
  [[nodiscard]] const std::vector<std::string>& lines() const { return _lines; }
  /// Whether any source gave something.
  [[nodiscard]] bool gaveSomething() const { return _gaveSomething; }
  /// Whether a file could not be written; the lines say which.
  [[nodiscard]] bool hasFailed() const { return _hasFailed; }
  /// The note: the reason for the dump, what cut it short if anything did, and the lines. It is no source
  /// and counts as nothing that was given.
  void writeNote(const std::string& name, const std::string& reason, const Patience& patience);

 private:
  [[nodiscard]] std::string _at(const std::string& fileName) const;
  bool _place(const std::string& name, std::string_view content);
  void _fail(const std::string& name, const std::string& reason);

  const std::string _directory;
  const std::string _prefix;
  const Descriptor _opened;        // the directory
  const std::error_code _trouble;  // why it is not
  std::vector<std::string> _lines;
  bool _gaveSomething = false;
  bool _hasFailed = false;
};

}  // namespace zal::helper
