#pragma once

#include <string>
#include <system_error>

namespace zal {

/// Makes the directory with all missing parents. Each one that was made gets mode 0777 whatever the
/// umask says, for several users' daemons write there; one that existed keeps its mode. Returned:
/// no error when the directory is there at the end. Any thread.
std::error_code createDirectoriesWithMode0777(const std::string& path);

}  // namespace zal
