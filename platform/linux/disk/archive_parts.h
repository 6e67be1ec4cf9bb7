#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace zal {

// Single parts of an archive that this agent may have made. The file stays the caller's. Whatever it holds,
// nothing worse comes of it than a wrong answer. Any thread. Throws std::bad_alloc.

/// The manifest it ends with, whole; nothing when there is none, or a longer one.
[[nodiscard]] std::optional<std::string> manifestIn(int archive, std::uint64_t longest);
/// The beginning of the session's log in it, some 256 KiB of it; empty when there is none.
[[nodiscard]] std::string sessionLogStart(int archive);

/// Whether a file of this name, right below a session's directory, is its log.
[[nodiscard]] bool isSessionLogName(std::string_view name);
/// Whether a session's log, or its beginning, has a header line with a failure reason.
[[nodiscard]] bool hasFailureReason(std::string_view log);

}  // namespace zal
