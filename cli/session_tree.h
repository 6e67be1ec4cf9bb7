#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cli/archive_reader.h"

namespace zal {

/// One session that was written out: what its directory's name says, and what lies in it. A while
/// after its end the directory becomes an archive.
struct SessionDirectory {
  std::string type;
  std::string started;  ///< "2024-05-02 14:03:07"
  std::string zone;     ///< "CEST"
  std::string role;     ///< "Initiator" or "Receiver"
  std::string path;     ///< of the directory or the archive
  bool isArchive = false;
  std::vector<SessionFile> files;  ///< by path

  [[nodiscard]] std::uint64_t bytes() const;
};

/// From "2024-05-02 at 14-03-07 (CEST) (Initiator)"; nothing when the name is another's.
[[nodiscard]] std::optional<SessionDirectory> parseSessionName(std::string_view name);

/// The session whose directory or archive this is; nothing when it is neither. A name that says
/// nothing leaves those fields empty.
[[nodiscard]] std::optional<SessionDirectory> readSession(const std::string& path, ArchiveReader& archives);

/// All sessions below `root`/TYPE, the latest first. What cannot be read is left out.
[[nodiscard]] std::vector<SessionDirectory> findSessions(const std::string& root, ArchiveReader& archives);

}  // namespace zal
