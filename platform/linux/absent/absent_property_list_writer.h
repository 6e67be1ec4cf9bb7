#pragma once

#include "platform/property_list_writer.h"

namespace zal {

/// For a host without property lists. Any thread.
class AbsentPropertyListWriter : public PropertyListWriter {
 public:
  std::error_code write(const ValueMap& /*dictionary*/, const std::string& /*path*/) override {
    return std::make_error_code(std::errc::not_supported);
  }
};

}  // namespace zal
