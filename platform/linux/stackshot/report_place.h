#pragma once

#include <string>
#include <string_view>
#include <system_error>

namespace zal::stackshot {

/// Puts the report there in one step, readable for its owner alone. In a directory, which is
/// made when the place ends with a slash, it gets the name or, when that is taken, a variant of it; any
/// other path is replaced; "-" is the standard output.
struct PlacedReport {
  std::string path;       ///< empty for the standard output
  std::error_code error;  ///< why there is none
};
[[nodiscard]] PlacedReport placeReport(const std::string& place, const std::string& name,
                                       std::string_view text);

}  // namespace zal::stackshot
