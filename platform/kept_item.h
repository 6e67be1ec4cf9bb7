#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "platform/clock.h"

namespace zal {

/// What the agent keeps on the disk for later.
enum class KeptKind {
  session,    ///< a session's directory, or the archive that it became
  dump,       ///< the same of a dump that somebody asked for
  stub,       ///< the manifest that is left of an archive
  record,     ///< of the black box
  temporary,  ///< an archive that is being made, or was when its agent ended
};

/// "session", "dump", "stub", "record", "temporary".
[[nodiscard]] std::string_view keptKindText(KeptKind kind);

/// One thing that is kept or goes as a whole.
struct KeptItem {
  KeptKind kind = KeptKind::session;
  std::string type;          ///< of the session; empty for records and temporary files
  std::string path;          ///< absolute
  std::uint64_t bytes = 0;   ///< that it takes of the disk; of a file with several names its share
  WallTime changed{};        ///< the file or the directory itself
  bool isDirectory = false;  ///< not an archive
  bool isElsewhere = false;  ///< on another file system than the reports
  bool isLeftover = false;   ///< of an agent that is gone; of no use to anybody
  bool hasFailed = false;    ///< of a call with a failure reason
  std::string inUse;         ///< why it must stay; empty: it may go
};

/// Of the file system that the reports lie on.
struct DiskRoom {
  std::uint64_t total = 0;  ///< 0: it cannot be told
  std::uint64_t free = 0;   ///< to the agent's user
};

/// What the name of a file or directory below the report root says.
struct KeptName {
  KeptKind kind = KeptKind::session;  ///< session, dump or stub
  bool isArchive = false;             ///< or else a directory, unless it is a stub
};

/// The name that a session's or a dump's directory, archive or stub has: with the date that all of them have.
/// Nothing for any other.
[[nodiscard]] std::optional<KeptName> keptNameOf(std::string_view name);
/// The path of what is left of the archive when it goes.
[[nodiscard]] std::string stubPathOf(std::string_view archive);

}  // namespace zal
