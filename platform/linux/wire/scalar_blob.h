#pragma once

#include <array>
#include <cstdint>
#include <string_view>

#include "platform/value.h"

namespace zal {

/// A FlexBuffers buffer that holds nothing but one number, in its own bytes: what a coded value is.
class ScalarBlob {
 public:
  explicit ScalarBlob(const Number& number);
  /// As long as this object.
  [[nodiscard]] std::string_view bytes() const { return {_bytes.data(), _size}; }

 private:
  std::array<char, 10> _bytes{};  // up to eight of the value, its type, its width
  std::size_t _size = 0;
};

}  // namespace zal
