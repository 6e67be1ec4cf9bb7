#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "platform/spill_files.h"
#include "session/line_part.h"

namespace zal {

// A run is a row of lines in their order: ascending times, the later arrival first among equal ones. In a
// spill file each line is
//
//     8    its time, a double
//     4    length
//     n    the bytes that stand for it in the log file, newline included
//
// in the byte order of the host, for nobody else reads it.

/// Where a run lies in its file.
struct LineRun {
  std::uint64_t offset = 0;
  std::uint64_t size = 0;
};

/// Puts lines [begin, end) of the part into their order and, as a run, at the end of the file. False: the
/// disk refused them.
[[nodiscard]] bool appendRun(const LinePart& part, std::size_t begin, std::size_t end, SpillFile& file,
                             std::string& buffer);

/// A run that is read line by line.
class LineRunReader {
 public:
  virtual ~LineRunReader() = default;
  /// On to the next line. False: there is none, or it cannot be read.
  virtual bool next() = 0;
  [[nodiscard]] virtual double time() const = 0;
  /// The bytes for the log file; valid until the next call of next().
  [[nodiscard]] virtual std::string_view bytes() const = 0;
  /// Whether the medium did not give back what was written to it.
  [[nodiscard]] virtual bool failed() const = 0;
};

[[nodiscard]] std::unique_ptr<LineRunReader> readerOf(SpillFile& file, const LineRun& run,
                                                      std::size_t bufferSize);
/// Of lines [begin, end of the part), which outlives it.
[[nodiscard]] std::unique_ptr<LineRunReader> readerOf(const LinePart& part, std::size_t begin);

/// Takes the runs, in the order of their arrival, together into one. False: not all of it could be read.
[[nodiscard]] bool mergeRuns(const std::vector<std::unique_ptr<LineRunReader>>& runs,
                             const std::function<void(std::string_view bytes)>& take);

}  // namespace zal
