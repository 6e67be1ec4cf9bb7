#pragma once

#include <optional>
#include <string_view>

#include "platform/value.h"

namespace zal {

/// The dictionary that a reply's payload holds; nothing when it is not well-formed.
[[nodiscard]] std::optional<ValueMap> decodeReply(std::string_view payload);

}  // namespace zal
