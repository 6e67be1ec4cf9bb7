#pragma once

#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <string_view>

namespace zal {

class AgentLog;
class FileCollector;

/// Paths that clients asked to collect, by category.
using FilesByCategory = std::map<std::string, std::set<std::string>, std::less<>>;

/// The category as a relative path without "." and "..", empty for the directory itself. Nothing when
/// it would lead out of the directory or holds control characters.
[[nodiscard]] std::optional<std::string> containedCategory(std::string_view category);

/// "{path, path}"
[[nodiscard]] std::string fileSetText(const std::set<std::string>& files);

/// The text with its control characters shown as "?": for names that come from clients.
[[nodiscard]] std::string printable(std::string_view text);
[[nodiscard]] bool hasControlCharacters(std::string_view text);

/// Moves the files of each category into that subdirectory. A category that would lead out of the
/// directory is refused with a warning, one that cannot be made is passed over; the others go on.
void placeCollectedFiles(const FilesByCategory& files, const std::string& directory, FileCollector& collector,
                         AgentLog& log);

}  // namespace zal
