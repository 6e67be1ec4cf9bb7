#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <filesystem>
#include <string>

#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// Gives each file of a corpus to a fuzzer's entry. A broken promise ends the process, after the name of the
/// input was printed. Returned: how many there were.
inline int runCorpus(const std::string& directory, void (*entry)(const std::uint8_t*, std::size_t)) {
  int inputs = 0;
  for (const auto& file : std::filesystem::directory_iterator(directory)) {
    SCOPED_TRACE(file.path().string());
    const std::string bytes = readFile(file.path().string());
    entry(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size());
    ++inputs;
  }
  return inputs;
}

}  // namespace zal::testing
