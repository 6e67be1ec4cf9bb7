#pragma once

#include <string>
#include <string_view>

namespace zal {

/// The path resolved and standardised: a leading "~" or "~/" is the given home directory, symbolic
/// links are followed as far as the path exists, "." and ".." are gone, and so is a slash at the
/// end. A path that cannot be followed (a circle of links) is standardised as text alone. A path
/// that names nothing is as good as any other; a relative one starts at the working directory.
/// Any thread; asks the file system.
[[nodiscard]] std::string resolveAndStandardize(std::string_view path, std::string_view home);

/// The same for a path below a root, with only the root's own links followed: what stands below it is text
/// alone, so that a link there shows when the path is used. One that is not below the root is resolved whole.
[[nodiscard]] std::string standardizeBelowRoot(std::string_view path, std::string_view root,
                                               std::string_view home);

}  // namespace zal
