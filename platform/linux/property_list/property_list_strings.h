#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace zal {

/// The string values of a property list in XML whose root is a dictionary; values of other types are
/// left out, and of a key given twice the first counts. Nothing when the text is no such list.
///
///     <plist version="1.0"><dict><key>ProductName</key><string>Phone</string></dict></plist>
[[nodiscard]] std::optional<std::map<std::string, std::string>> propertyListStrings(std::string_view text);

}  // namespace zal
