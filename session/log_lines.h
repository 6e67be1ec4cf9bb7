#pragma once

#include <memory>
#include <string_view>
#include <vector>

#include "session/text_arena.h"

namespace zal {

/// The lines of one log in the order of writing, all kept by the arena. Copying it copies references;
/// the texts live on with the last copy, whatever becomes of the list they came from.
struct LogLines {
  std::vector<std::string_view> lines;
  std::shared_ptr<const TextArena> texts;
};

}  // namespace zal
