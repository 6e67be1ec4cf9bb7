#pragma once

#include "platform/property_list_writer.h"

namespace zal {

/// Makes the whole text in memory, then writes it. What fails half-way leaves half a file.
class PugixmlPropertyListWriter : public PropertyListWriter {
 public:
  std::error_code write(const ValueMap& dictionary, const std::string& path) override;
};

}  // namespace zal
