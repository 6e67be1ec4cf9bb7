#pragma once

#include <cstddef>
#include <optional>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/value.h"

namespace zal {

/// What a dictionary that others send may cost.
struct DictionaryLimits {
  std::size_t values = 65'536;  ///< those inside others counted, variants not
  std::size_t bytes = 0;        ///< text and keys
  int depth = 32;               ///< containers in each other, variants too
};

struct ReadDictionary {
  ValueMap values;
  std::size_t bytes = 0;  ///< text and keys
};

/// The dictionary (a{sv}) at the message's position. Integers of any width become int64 or uint64 by
/// their sign, texts of every kind strings, variants what is in them, arrays and structs lists, arrays
/// of entries with texts as keys dictionaries; what has no place there becomes null. Of a key that is
/// there twice the first counts. Nothing when it is beyond the limits. Throws sdbus::Error for a
/// message that is not well-formed.
[[nodiscard]] std::optional<ReadDictionary> readDictionary(sdbus::Message& message,
                                                           const DictionaryLimits& limits);

/// Appends the dictionary as a{sv}. Nulls are left out; lists become av; bytes that are no UTF-8 U+FFFD.
void writeDictionary(sdbus::Message& message, const ValueMap& values);

}  // namespace zal
