#pragma once

#include <string>

#include "platform/platform.h"

namespace zal {

/// Where the sessions of a type lie, home-relative where they are below the home directory.
[[nodiscard]] std::string sessionDirectory(const Platform& platform, const std::string& sessionTypeKey);

}  // namespace zal
