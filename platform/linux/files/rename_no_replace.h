#pragma once

#include <string>
#include <system_error>

namespace zal {

/// Gives the file or directory another name on the same file system; whatever stands at the target
/// makes it fail with file_exists. Any thread. Returned: why not.
[[nodiscard]] std::error_code renameNoReplace(const std::string& source, const std::string& target);
/// The same with each path relative to an open directory, unless it is absolute.
[[nodiscard]] std::error_code renameNoReplaceAt(int sourceDirectory, const std::string& source,
                                                int targetDirectory, const std::string& target);

/// The same where the file system has no such rename: a file by a second link, still in one step; a
/// directory, which cannot have two names, after a look at the target, which another process can
/// only upset by making an empty directory there in between.
[[nodiscard]] std::error_code renameNoReplaceInSteps(int sourceDirectory, const std::string& source,
                                                     int targetDirectory, const std::string& target);

/// Whether anything has that name, a dangling link included. An error when nobody can tell.
[[nodiscard]] bool nameIsTaken(const std::string& path, std::error_code& error);
[[nodiscard]] bool nameIsTakenAt(int directory, const std::string& path, std::error_code& error);

}  // namespace zal
