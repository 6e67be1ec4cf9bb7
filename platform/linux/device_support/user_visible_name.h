#pragma once

#include <string>
#include <string_view>

namespace zal {

/// The name that the user gave the device: PRETTY_HOSTNAME of a machine-info file's text, else the
/// host name. Always UTF-8 in one line: other bytes become U+FFFD, control characters are left out,
/// as are blanks around it.
[[nodiscard]] std::string userVisibleName(std::string_view machineInfo, std::string_view hostName);

}  // namespace zal
