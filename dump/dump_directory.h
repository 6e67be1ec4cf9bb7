#pragma once

#include <cstddef>
#include <optional>
#include <string>

#include "dump/dump_request.h"

namespace zal {

/// How much of a description stands in the directory's name, in UTF-16 units.
inline constexpr std::size_t kDescriptionInName = 20;
/// Bytes of the directory's own name. Less than a file name may have, for the archive beside it is
/// named after it and so is what could not be archived.
inline constexpr std::size_t kLongestDumpName = 230;
/// Bytes of the whole path; leaves room for what is gathered in it.
inline constexpr std::size_t kLongestDumpPath = 3500;

/// Where a dump of this type, time and description goes: `root`/TYPE/TYPE-Log (TIME) (DESCRIPTION),
/// resolved and standardised; the last part only with a description that is more than white space.
/// Slashes in type and description make directories; control characters become "_", and names that
/// no file system takes are cut at a character's border, the time text excepted. Nothing when the
/// path would not lie below the root, when a symbolic link stands in it there, or when it is too long. A
/// leading "~" of the root is the home.
[[nodiscard]] std::optional<std::string> dumpDirectoryPath(const std::string& reportRoot,
                                                           const std::string& home,
                                                           const DumpRequest& request,
                                                           const std::optional<std::string>& description);

}  // namespace zal
