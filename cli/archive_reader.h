#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <system_error>
#include <vector>

#include "platform/archive_inspection.h"

namespace zal {

/// A file in a session or an archive, by its path below the directory.
struct SessionFile {
  std::string path;
  std::uint64_t bytes = 0;
};

/// Looks into the archives that collections become. Main thread only.
class ArchiveReader {
 public:
  virtual ~ArchiveReader() = default;
  /// The files below the archive's one top directory, in its order; nothing when it is no archive.
  [[nodiscard]] virtual std::optional<std::vector<SessionFile>> files(const std::string& archive) = 0;
  /// One of them, whole; nothing when it cannot be read.
  [[nodiscard]] virtual std::optional<std::string> text(const std::string& archive,
                                                        const std::string& path) = 0;
  /// Reads all of it. Returned: why nothing could be read; what is wrong with it stands in the inspection.
  [[nodiscard]] virtual std::error_code inspect(const std::string& archive, ArchiveInspection& into) = 0;
};

}  // namespace zal
