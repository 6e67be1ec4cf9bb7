#pragma once

#include <string>

#include "platform/linux/files/descriptor.h"

namespace zal {

/// The directory of a log set, by a handle to look things up by. The root may be reached through symbolic
/// links, the set may not. Any thread. Not open: errno says why.
[[nodiscard]] Descriptor openLogSet(const std::string& root, const std::string& set);
/// The same by the directory's path, whose last component is the set.
[[nodiscard]] Descriptor openLogSet(const std::string& directory);

}  // namespace zal
