#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace zal {

/// "Name: NAME   Device: DEVICE   ", without what is empty; three blanks behind each, no line break.
[[nodiscard]] std::string deviceInfoText(std::string_view deviceName, std::string_view deviceDescription);

/// Writes the file whole or not at all, replacing one of that name; a failure leaves nothing behind
/// and is not reported.
void writeWholeFile(const std::string& path, std::string_view text);

}  // namespace zal
