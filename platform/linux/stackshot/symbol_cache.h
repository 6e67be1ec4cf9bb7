#pragma once

#include <sys/types.h>

#include <cstdint>
#include <map>
#include <string>

namespace zal::stackshot {

/// The function at a place of a file. Most threads of a machine sleep in the same few functions of the same
/// few libraries, and to look one up means to go through all symbols of its file.
struct SymbolPlace {
  dev_t device = 0;
  ino_t file = 0;
  std::uint64_t address = 0;  ///< from where the file is mapped
  auto operator<=>(const SymbolPlace&) const = default;
};

struct Symbol {
  std::string function;      ///< empty when no symbol covers the place
  std::uint64_t offset = 0;  ///< of the place in the function
};

/// For one run of the program.
using SymbolCache = std::map<SymbolPlace, Symbol>;

}  // namespace zal::stackshot
