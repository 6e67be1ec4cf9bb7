#pragma once

#include <string>

#include "platform/spill_files.h"

namespace zal {

/// Files without a name in a private directory: the kernel takes them back however the process ends.
class UnnamedSpillFiles final : public SpillFiles {
 public:
  explicit UnnamedSpillFiles(std::string directory) : _directory(std::move(directory)) {}
  [[nodiscard]] std::unique_ptr<SpillFile> make() override;

 private:
  const std::string _directory;
};

}  // namespace zal
