#pragma once

#include <optional>
#include <string>

namespace zal {

class CommandRunner;

/// Asks the reference-time tool for the time that the logs of several devices can be lined up by, and
/// waits for it. What the tool says stays in "time-file.txt" in the directory; a shell that does not
/// find the tool says so there, and that is the answer then. Nothing when the file cannot be read as
/// text, or is somebody else's that cannot be removed.
[[nodiscard]] std::optional<std::string> referenceTime(CommandRunner& commands, const std::string& directory);

}  // namespace zal
