#pragma once

#include <utility>

#include "platform/linux/files/rooted_paths.h"
#include "platform/property_list_writer.h"

namespace zal {

/// Makes the whole text in memory, then writes it. What fails half-way leaves half a file.
class PugixmlPropertyListWriter : public PropertyListWriter {
 public:
  explicit PugixmlPropertyListWriter(RootedPaths paths = {}) : _paths(std::move(paths)) {}
  std::error_code write(const ValueMap& dictionary, const std::string& path) override;

 private:
  const RootedPaths _paths;
};

}  // namespace zal
