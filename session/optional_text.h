#pragma once

#include <optional>
#include <string_view>

namespace zal {

/// A text that a caller may not have given; borrowed for the call.
using OptionalText = std::optional<std::string_view>;

/// Whether there is nothing to show: not given, or given with length 0.
[[nodiscard]] inline bool isEmptyText(OptionalText text) { return !text || text->empty(); }

/// The text, or the substitute when there is nothing to show.
[[nodiscard]] inline std::string_view textOr(OptionalText text, std::string_view substitute) {
  return isEmptyText(text) ? substitute : *text;
}

}  // namespace zal
