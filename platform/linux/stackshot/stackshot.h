#pragma once

#include <string>
#include <vector>

namespace zal::stackshot {

/// The program; the words are its arguments without its name. Returned: its exit status.
[[nodiscard]] int run(const std::vector<std::string>& words);

}  // namespace zal::stackshot
