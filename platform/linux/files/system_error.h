#pragma once

#include <cerrno>
#include <system_error>

namespace zal {

/// What the last failed system call left in errno.
[[nodiscard]] inline std::error_code lastSystemError() { return {errno, std::generic_category()}; }

}  // namespace zal
