#include "cli/table_text.h"

namespace zal {

std::string padded(std::string text, std::size_t width, bool right) {
  if (text.size() < width) text.insert(right ? 0 : text.size(), width - text.size(), ' ');
  return text;
}

}  // namespace zal
