#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string_view>
#include <vector>

#include "session/text_arena.h"
#include "session/zal_pair.h"

namespace zal {

/// Lines of one log in order of arrival, with the times that decide their places (never NaN), and what
/// keeps their texts.
struct LinePart {
  std::vector<ZalPair<std::string_view, double>> lines;
  std::shared_ptr<TextArena> texts;
};

/// Of one line, its text and what goes with it.
[[nodiscard]] inline std::uint64_t memoryOfLine(std::string_view text) {
  return text.size() + 1 + sizeof(ZalPair<std::string_view, double>);
}

}  // namespace zal
