#pragma once

#include <cstddef>
#include <string>
#include <system_error>

namespace zal {

inline constexpr std::size_t kLargestTextFile = std::size_t{1} << 20U;

/// Reads a whole small regular file; never waits on a pipe or device that stands in its place.
/// Returned: an error for what is missing, unreadable, no regular file, or larger than so many bytes.
[[nodiscard]] std::error_code readTextFile(const std::string& path, std::string& content,
                                           std::size_t mostBytes = kLargestTextFile);

/// Puts a synced file in the place of the old one in one step, keeping the old one's mode and
/// following a symbolic link; makes missing directories. Returned: why not; the old file stands.
[[nodiscard]] std::error_code replaceTextFile(const std::string& path, const std::string& content);

}  // namespace zal
