#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace zal {

class AgentLog;
class FilePlacement;

/// "Name: NAME   Device: DEVICE   ", without what is empty; three blanks behind each, no line break.
[[nodiscard]] std::string deviceInfoText(std::string_view deviceName, std::string_view deviceDescription);

/// Writes the file whole or not at all, replacing one of that name; a failure leaves nothing behind
/// but one warning.
void writeWholeFile(FilePlacement& files, AgentLog& log, const std::string& path, std::string_view text);

}  // namespace zal
