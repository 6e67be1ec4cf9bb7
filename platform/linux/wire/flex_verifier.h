#pragma once

#include <optional>
#include <string_view>

#include "platform/linux/wire/flex_value.h"

namespace zal {

/// Maps and vectors inside each other, the root included.
inline constexpr int kMaximumFlexDepth = 32;

/// The root of a FlexBuffers buffer, once every value in it was found to lie inside the buffer and
/// every key to end there; nothing when one does not. Needs no memory and visits at most as many
/// values as the buffer has bytes, however they point at each other.
///
/// The format's own verifier does not do here: it takes a key without an end for whole, lets shared
/// vectors cost quadratic time, and with its remedy for that counts shared texts as nesting, so that
/// honest messages fail. Beyond it this one asks a map for as many keys as values, and floats for
/// four or eight bytes.
[[nodiscard]] std::optional<FlexValue> verifiedFlexRoot(std::string_view buffer);

}  // namespace zal
