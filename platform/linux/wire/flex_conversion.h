#pragma once

#include <cstddef>
#include <optional>
#include <string_view>

#include "platform/linux/wire/flex_value.h"
#include "platform/value.h"

namespace zal {

/// What one dictionary may become: payloads that let many entries share one long text would
/// otherwise grow without bound when each gets its own copy.
inline constexpr std::size_t kMaximumDictionaryValues = 65'536;
inline constexpr std::size_t kMaximumDictionaryText = 16U << 20U;  ///< bytes of texts and keys

/// The map and everything below it as objects of their own, texts as valid UTF-8. Nothing when it
/// goes beyond the bounds above. Entries that are no plain value (a blob that holds none) are left
/// out of maps and are null in lists; of keys that are the same the first counts.
[[nodiscard]] std::optional<ValueMap> convertedMap(const FlexMap& map);

/// The content of a coded value, a buffer of its own: null, boolean, number or string. Nothing when
/// it holds anything else, or is not well-formed.
[[nodiscard]] std::optional<Value> decodedScalar(std::string_view blob);

}  // namespace zal
