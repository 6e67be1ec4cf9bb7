#pragma once

#include <string>
#include <string_view>

#include "platform/value.h"

namespace zal {

/// The dictionary as a property list in XML, version 1.0, indented, without a document type: readers
/// need none, and it would name a host to ask. Null values are left out, reals have as many digits
/// as it takes to read them back, and integers are as large as 64 bits can be, signed or not.
[[nodiscard]] std::string propertyListText(const ValueMap& dictionary);

/// The text as XML can hold it: control characters other than tab and the two ends of a line (which
/// readers take for one) are left out, and so are U+FFFE and U+FFFF; what is no UTF-8 becomes U+FFFD.
[[nodiscard]] std::string textForXml(std::string_view text);

}  // namespace zal
