#pragma once

#include <cstddef>
#include <string>

#include "platform/clock.h"

namespace zal {

/// Removes hidden files, which get their names when they are whole: those of placeWholeFile() whose process
/// is gone, and others after a minute. For directories that hold nothing else that is hidden. Returned: how
/// many.
std::size_t removeUnfinishedFiles(const std::string& directory, WallTime now);

}  // namespace zal
