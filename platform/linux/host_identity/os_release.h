#pragma once

#include <map>
#include <string>
#include <string_view>

namespace zal {

/// The assignments of an os-release file: KEY=value, KEY="value" with backslash escapes, KEY='value'.
/// Comments and lines that are no assignment are passed over; of a key given twice the last counts.
[[nodiscard]] std::map<std::string, std::string> osReleaseValues(std::string_view text);

}  // namespace zal
