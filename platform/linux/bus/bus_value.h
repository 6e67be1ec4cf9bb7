#pragma once

#include <sdbus-c++/sdbus-c++.h>

#include "platform/value.h"

namespace zal {

/// What a message carries, as plain values that belong to no connection: variants are what is in them,
/// structures and arrays are lists, dictionaries are maps with their keys as text, object paths and
/// signatures are texts. Integers with a sign are signed, the others and bytes unsigned. Descriptors are
/// null and not kept. Who reads a property from this looks whether it is of the kind that it should be.
/// Throws sdbus::Error for a message that is damaged.
[[nodiscard]] ValueList readValues(sdbus::Message& message);

}  // namespace zal
