#pragma once

#include <memory>
#include <string>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/tessel/line_splitter.h"
#include "platform/linux/tessel/log_source.h"

namespace zal::tessel {

/// The kernel's ring buffer, by /dev/kmsg or a file that gives the same records.
class KernelSource final : public LogSource {
 public:
  /// None when it cannot be opened, and then `trouble` says why.
  [[nodiscard]] static std::unique_ptr<KernelSource> open(const std::string& path, const Clock& clock,
                                                          std::string& trouble);
  [[nodiscard]] std::optional<std::string> print(std::optional<WallTime> since, LineOutput& output) override;
  [[nodiscard]] std::string follow(LineOutput& output) override;

 private:
  KernelSource(Descriptor file, std::string path, const Clock& clock);
  enum class End { nothingMore, endOfFile };
  /// Up to the last record there is.
  std::optional<std::string> _printRest(WallTime since, LineOutput& output, End& end);

  Descriptor _file;
  std::string _path;
  const Clock& _clock;
  std::string _host;
  LineSplitter _lines;
};

}  // namespace zal::tessel
