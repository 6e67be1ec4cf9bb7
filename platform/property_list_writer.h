#pragma once

#include <string>
#include <system_error>

#include "platform/value.h"

namespace zal {

/// Writes property lists in their XML form (version 1.0). Any thread; may wait for a disk.
class PropertyListWriter {
 public:
  virtual ~PropertyListWriter() = default;
  /// Written in place, not atomically; an existing file is replaced. Keys stand in order of their
  /// bytes. What a property list cannot hold is left out: null values, and control characters in
  /// texts (XML 1.0 forbids them). Returned: why it was not written.
  virtual std::error_code write(const ValueMap& dictionary, const std::string& path) = 0;
};

}  // namespace zal
