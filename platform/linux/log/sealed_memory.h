#pragma once

#include <initializer_list>
#include <string_view>

#include "platform/linux/files/descriptor.h"

namespace zal {

/// The parts, one behind the other, in memory that nobody can change any more and that a descriptor
/// stands for; none when the kernel refuses, with the reason in errno.
[[nodiscard]] Descriptor makeSealedMemory(std::initializer_list<std::string_view> parts);

}  // namespace zal
