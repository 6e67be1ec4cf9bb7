#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace zal {

/// An entry of an archive, directories too, as reading it showed it.
struct InspectedEntry {
  std::string name;  ///< any bytes
  std::uint64_t bytes = 0;
  std::string sha256;   ///< 64 hexadecimal digits; empty for a directory or when damaged
  std::string trouble;  ///< what it has or does that it should not; empty: nothing
};

/// An archive read from one end to the other.
struct ArchiveInspection {
  bool isArchive = false;  ///< it begins or ends like one
  std::string trouble;     ///< what is wrong with it as a whole; the entries before that are listed
  std::vector<InspectedEntry> entries;
  std::optional<std::string> lastText;  ///< of the last entry, when it is whole and no longer than 64 MiB
};

}  // namespace zal
