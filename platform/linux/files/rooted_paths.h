#pragma once

#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "platform/directory_roots.h"
#include "platform/linux/files/descriptor.h"

namespace zal {

/// A name in a directory that is open: no link put in the way since leads elsewhere.
struct RootedPlace {
  Descriptor directory;   ///< to look things up by
  std::string name;       ///< one component
  std::error_code error;  ///< why there is no such place; the directory is not open then
};

/// Opens the directories of absolute paths. A root may be reached through symbolic links; from there on the
/// way leads through directories alone (platform/linux/files/beneath.h). Of several roots the innermost
/// counts. A path below none of them is taken as it is, links and all. Any thread.
class RootedPaths {
 public:
  /// Without roots.
  RootedPaths() = default;
  /// Absolute, or beginning with "~", which is the home directory.
  RootedPaths(const std::vector<std::string>& roots, std::string_view home);

  [[nodiscard]] RootedPlace placeOf(const std::string& path) const;
  /// Makes the directory with all missing parents, each that was made with mode 0777.
  std::error_code makeDirectories(const std::string& path) const;

 private:
  struct Split {
    std::string root;  // empty: below none
    std::string rest;
  };
  [[nodiscard]] Split _split(const std::string& path) const;

  std::vector<std::string> _roots;  // the longest first
};

/// Those that the agent or its programs write below.
[[nodiscard]] std::vector<std::string> writtenRoots(const DirectoryRoots& roots);

}  // namespace zal
