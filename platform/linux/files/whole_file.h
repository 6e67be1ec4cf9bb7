#pragma once

#include <sys/types.h>

#include <optional>
#include <string>
#include <string_view>
#include <system_error>

namespace zal {

/// What becomes of a file that has the name already.
enum class ExistingFile { isReplaced, stays };

/// Puts a small file, readable for its owner alone, under the path in one step: others see all of it
/// or nothing. Its directory must exist. Not synced: for what need not outlive the host. A hidden
/// temporary file beside it goes again in every case. Any thread. Returned: why not; file_exists when
/// the name was taken and the file there stays.
[[nodiscard]] std::error_code placeWholeFile(const std::string& path, std::string_view content,
                                             ExistingFile existing);

/// Of a name that placeWholeFile() gives to what is not whole yet: its process. Nothing for other names.
[[nodiscard]] std::optional<pid_t> makerOfUnfinished(std::string_view name);

/// Writes everything at the descriptor's position. Returned: why only a part of it.
[[nodiscard]] std::error_code writeWhole(int descriptor, std::string_view content);

}  // namespace zal
