#pragma once

#include <string>
#include <string_view>

namespace zal::tessel {

/// A descriptor to which every message goes whole and at once: the program ends by SIGKILL, and what
/// it held back then would be lost.
class LineOutput {
 public:
  explicit LineOutput(int descriptor) : _descriptor(descriptor) {}
  /// False when it cannot be written; trouble() says why from then on.
  [[nodiscard]] bool write(std::string_view lines);
  [[nodiscard]] const std::string& trouble() const { return _trouble; }

 private:
  int _descriptor;
  std::string _trouble;
};

}  // namespace zal::tessel
